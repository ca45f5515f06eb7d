// SPDX-License-Identifier: MIT
#include <syslog.h>

#include <cstdarg>
#include <cstdio>

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

class Syslog final : public SystemLogWorld {
 public:
  Syslog() { written.clear(); }
  SystemLog& log() override { return *log_; }
  std::string text() override { return written; }

 private:
  const std::unique_ptr<SystemLog> log_ = POSIX::makeSystemLog();
};
INSTANTIATE_TEST_SUITE_P(POSIX, SystemLogContract, SystemLogContract::on<Syslog>());

}  // namespace
}  // namespace Varnel::Platform::Contract
