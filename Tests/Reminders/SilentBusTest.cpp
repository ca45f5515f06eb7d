// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <Tests/Support/DrainUntil.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform {
namespace {

// Takes connections and never says a word.
class SilentBus final {
 public:
  SilentBus() {
    const std::string path = (folder_.path() / "bus").string();
    sockaddr_un address{.sun_family = AF_UNIX, .sun_path = {}};
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    EXPECT_EQ(::bind(socket_.get(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    EXPECT_EQ(::listen(socket_.get(), 8), 0);
    ::setenv("DBUS_SESSION_BUS_ADDRESS", ("unix:path=" + path).c_str(), 1);
  }

 private:
  const Tests::TemporaryFolder folder_;
  const POSIX::FileDescriptor socket_{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
};

TEST(NotificationServer, ABusThatNeverAnswersCostsTheBannersAndNoWaiting) {
  const SilentBus bus;
  Banner banner;
  banner.title = "title";
  const auto mainQueue = Linux::makeMainQueue();
  Testing::CapturedSystemLog log;
  {
    const auto ended = Linux::makeNotificationServer(log);
    ended->show("token", banner, {});
    EXPECT_TRUE(ended->isBusy());
  }
  const auto server = Linux::makeNotificationServer(log, std::chrono::milliseconds(50));
  // Each attempt comes to an end, and the next banner makes another.
  std::string lines;
  for (int attempt = 0; attempt < 2; ++attempt) {
    server->show("token", banner, {});
    server->close("other", "guid :1.1 7");
    EXPECT_EQ(log.text(), lines);
    EXPECT_TRUE(Tests::drainUntil(*mainQueue, [&] { return !server->isBusy(); }));
    EXPECT_EQ(log.text(),
              lines += "Cannot show a notification: The session bus does not answer.\n");
  }
}

}  // namespace
}  // namespace Varnel::Platform
