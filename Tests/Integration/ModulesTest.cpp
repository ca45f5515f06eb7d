// SPDX-License-Identifier: MIT
#include <dlfcn.h>
#include <gmock/gmock.h>

#include <chrono>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Values/NotificationSource.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

namespace {

// What the framework asks the loader for: the threads by module, none of which is found while they
// are missing.
struct Loader final {
  std::mutex mutex;
  std::map<std::string, std::thread::id> threads;
  bool isEmpty = true;
};

Loader& loader() {
  static Loader& loader = *new Loader;
  return loader;
}

}  // namespace

// Stands before the system's.
void* dlopen(const char* file, int mode) noexcept {
  static const auto real = reinterpret_cast<decltype(&dlopen)>(::dlsym(RTLD_NEXT, "dlopen"));
  const std::string path = file ? file : "";
  if (path.find("/libvarnel-") == std::string::npos) return real(file, mode);
  const std::lock_guard lock(loader().mutex);
  loader().threads[path.substr(path.rfind('/') + 1)] = std::this_thread::get_id();
  return real(loader().isEmpty ? "/nowhere" : file, mode);
}

namespace Varnel::Platform {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

TEST(Modules, AreLoadedWithTheFirstUseByAThreadThatNobodyWaitsFor) {
  const Ports& ports = systemPorts();
  const Tests::TemporaryFolder folder;
  const auto transport =
      Tallyhouse::SpoolingTransport::make(ports, {.endpoint = *URL::parse("https://127.0.0.1:1/"),
                                                  .trackingID = "QN-1",
                                                  .clientID = "1",
                                                  .spoolPath = folder.path() / "spool"});
  const auto sound = ports.soundPlayer.get().load(std::string("RIFF\0\0\0\0WAVEfmt ", 16));
  Testing::CapturedSystemLog log;
  const auto server = Linux::makeNotificationServer(log, {});
  EXPECT_THAT(loader().threads, IsEmpty());

  sound->play();
  server->show("token", Banner(), {});
  transport->start();
  Tallyhouse::AnalyticsEvent event{};
  event.uuid = event.category = event.action = "a";
  transport->accept(event);
  transport->drain(std::chrono::seconds(30));
  EXPECT_TRUE(Tests::drainUntil(ports.mainQueue.get(),
                                [&] { return !sound->isPlaying() && !server->isBusy(); }));
  const std::lock_guard lock(loader().mutex);
  for (const char* module :
       {"libvarnel-curl.so", "libvarnel-gstreamer.so", "libvarnel-session-bus.so"}) {
    const auto loaded = loader().threads.find(module);
    ASSERT_NE(loaded, loader().threads.end()) << module;
    EXPECT_NE(loaded->second, std::this_thread::get_id()) << module;
  }
}

TEST(Modules, WithoutThatOfLocalesTextsArePlainAndCalendarsCountNoDays) {
  const auto zones = Linux::makeTimeZones();
  const Date date{std::chrono::sys_days(std::chrono::year(2024) / 5 / 5) + std::chrono::hours(13)};
  ::testing::internal::CaptureStderr();
  EXPECT_THAT(DateFormatter("d MMMM 'Uhr'", "de_DE", *zones).string(date),
              MatchesRegex("2024-05-0."));
  EXPECT_THAT(DateFormatter("h:mm", "de_DE", *zones).string(date),
              MatchesRegex("2024-05-0. ..:..:00"));
  EXPECT_EQ(ByteCountFormatter("de_DE").string(1'500'000, ByteCountStyle::file), "1.5 MB");
  const Calendar calendar("en_US", "UTC", *zones);
  EXPECT_EQ(calendar.adding({.month = 1}, date), std::nullopt);
  EXPECT_EQ(calendar.adding({.hour = 1}, date), date + std::chrono::hours(1));
  EXPECT_EQ(calendar.weekdayCount(), std::nullopt);
  const std::string told = ::testing::internal::GetCapturedStderr();
#ifndef NDEBUG
  EXPECT_THAT(told, HasSubstr("libvarnel-icu.so does not load: /nowhere"));
#endif
}

TEST(Modules, WithoutThatOfTheBusEveryRequestFailsInItsTimeAndALaterOneTriesAgain) {
  struct Observer final : NotificationServer::Observer {
    std::vector<std::string> failed;
    void bannerShown(const std::string&, const std::string&) override {}
    void bannerFailed(const std::string& token) override { failed.push_back(token); }
    void bannerActivated(const std::string&, const BannerActivation&) override {}
    void bannerDismissed(const std::string&) override {}
    void bannerGone(const std::string&) override {}
    void serverAppeared() override {}
  };
  ::setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere", 1);
  Testing::CapturedSystemLog log;
  const auto mainQueue = Linux::makeMainQueue();
  const auto server = Linux::makeNotificationServer(log, {});
  const auto observer = std::make_shared<Observer>();
  server->setObserver(observer);
  std::string obstacle;
  const auto ask = [&] {
    server->show("shown", Banner(), {});
    server->show("closed", Banner(), {});
    server->close("closed", {});
    server->check([&](const auto& error) { obstacle = error->localizedDescription(); });
    EXPECT_TRUE(server->isBusy());
    EXPECT_THAT(observer->failed, IsEmpty()) << "never within the call";
    EXPECT_TRUE(Tests::drainUntil(*mainQueue, [&] { return !server->isBusy(); }));
    EXPECT_THAT(std::exchange(observer->failed, {}),
                ::testing::UnorderedElementsAre("shown", "closed"));
  };
  ask();
  EXPECT_THAT(obstacle, HasSubstr("libvarnel-session-bus.so does not load: /nowhere"));
  ask();
  EXPECT_EQ(log.text(), "Cannot show a notification: " + obstacle + "\n") << "said once";
  loader().isEmpty = false;
  ask();
  EXPECT_THAT(obstacle, ::testing::Not(HasSubstr("libvarnel")));
}

}  // namespace
}  // namespace Varnel::Platform
