// SPDX-License-Identifier: MIT
#include <syslog.h>
#include <time.h>

#include <cstdarg>
#include <cstdio>

#include <Tests/Contract/MainLoopWorlds.h>
#include <Tests/Contract/ProcessWorlds.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace {
std::string written;
}

// In place of the C library's. The process's log is the host's: it is neither opened nor named.
extern "C" void openlog(const char*, int, int) {
  ADD_FAILURE();
}
extern "C" void syslog(int priority, const char* format, ...) {
  EXPECT_EQ(priority, LOG_USER | LOG_NOTICE);
  char line[20'000];
  std::va_list arguments;
  va_start(arguments, format);
  std::vsnprintf(line, sizeof line, format, arguments);
  va_end(arguments);
  written.append(line).append("\n");
}

namespace Varnel::Platform::Contract {
namespace {

class Syslog final : public AdapterColumn<SystemLogWorld, POSIX::makeSystemLog> {
 public:
  Syslog() { written.clear(); }
  std::string text() override { return written; }
};
INSTANTIATE_TEST_SUITE_P(POSIX, SystemLogContract, on<Syslog>());

class POSIXClock final : public AdapterColumn<ClockWorld, POSIX::makeClock> {
 public:
  void pass() override {
    const Date before = port_->now();
    while (port_->now() == before) continue;
    EXPECT_LE(std::abs(std::chrono::system_clock::to_time_t(port_->now()) - ::time(nullptr)), 60);
  }
};
INSTANTIATE_TEST_SUITE_P(POSIX, ClockContract, on<POSIXClock>());

}  // namespace
}  // namespace Varnel::Platform::Contract
