// SPDX-License-Identifier: MIT
#include <syslog.h>
#include <time.h>

#include <cstdarg>
#include <cstdio>
#include <cstdlib>

#include <Tests/Contract/MainLoopWorlds.h>
#include <Tests/Contract/ProcessWorlds.h>
#include <Tests/Support/OtherProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Ports.h>

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

/// Places and notes in a folder of the test's, beside a process that ends without a word.
class RuntimeFolder final : public SessionBoardWorld {
 public:
  RuntimeFolder() { ::setenv("XDG_RUNTIME_DIR", folder_.path().c_str(), 1); }
  SessionBoard& port() override { return *board_; }
  void postByAnother(const std::string& text) override {
    other_ = std::make_unique<Tests::OtherProcess>([&] {
      auto board = makeBoard();
      return board->post(text) ? nullptr : std::move(board);
    });
    ASSERT_TRUE(other_->isReady());
  }
  void endAnother() override { other_.reset(); }

 private:
  static std::unique_ptr<SessionBoard> makeBoard() {
    return POSIX::makeSessionBoard(systemPorts().privateFiles);
  }
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<SessionBoard> board_ = makeBoard();
  std::unique_ptr<Tests::OtherProcess> other_;
};
INSTANTIATE_TEST_SUITE_P(POSIX, SessionBoardContract, on<RuntimeFolder>());

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
