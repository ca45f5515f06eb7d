// SPDX-License-Identifier: MIT
#include <Tests/Contract/NotificationWorlds.h>
#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Generic/NotificationStore.h>

namespace Varnel::Platform::Contract {
namespace {

class StoredCenter final : public UserNotificationCenterWorld {
 public:
  UserNotificationCenter& port() override { return process_.center; }
  Date now() override { return process_.clock.now(); }
  void pass(std::chrono::seconds time) override {
    process_.timer.advanceTo(now() + time);
    process_.settle();
  }
  std::vector<std::string> banners() override {
    std::vector<std::string> titles;
    for (const Banner& each : process_.server.history()) titles.push_back(each.title);
    return titles;
  }
  void click(const UserNotification& notification) override {
    process_.server.activate(*notification.title);
  }
  void startBy(const UserNotification& notification) override {
    NotificationStore deliverers({process_.files, process_.log}, store_, Migrating::never);
    EXPECT_EQ(process_.textOf(deliverers.keepLaunch(notification, now())), "");
  }

 private:
  const Tests::TemporaryFolder folder_ = Tests::TemporaryFolder::inMemory();
  const std::string store_ = folder_.path() / "store.sqlite";
  Testing::Process process_{store_, std::chrono::sys_days(std::chrono::year(2026) / 3 / 1)};
};
INSTANTIATE_TEST_SUITE_P(Generic, UserNotificationCenterContract, on<StoredCenter>());

}  // namespace
}  // namespace Varnel::Platform::Contract
