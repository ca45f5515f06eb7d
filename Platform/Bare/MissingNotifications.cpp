// SPDX-License-Identifier: MIT
#include <system_error>
#include <utility>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>

namespace Varnel::Platform::Bare {
namespace {

// Refuses what would be a promise; its lists are empty.
class NoCenter final : public UserNotificationCenter {
 public:
  explicit NoCenter(MainQueue& queue) : queue_(queue) {}

  void setDelegate(std::weak_ptr<UserNotificationCenterDelegate>, Standing) override {}
  Result<std::optional<UserNotification>> takeLaunchNotification() override {
    return std::optional<UserNotification>();
  }
  Failure change(const std::function<Failure()>& calls) override { return calls(); }
  Failure scheduleNotification(const UserNotification&) override { return refusal(); }
  Notifications scheduledNotifications() override { return std::vector<UserNotification>(); }
  Failure removeScheduledNotification(const UserNotification&) override { return std::nullopt; }
  Failure deliverNotification(const UserNotification&) override { return refusal(); }
  Notifications deliveredNotifications() override { return std::vector<UserNotification>(); }
  Failure removeDeliveredNotification(const UserNotification&) override { return std::nullopt; }
  // No call that failed will ever succeed.
  void retryLater(std::function<void()>) override {}
  void checkBanners(std::function<void(const Failure&)> answer) override {
    queue_.post([answer = std::move(answer)] { answer(refusal()); });
  }
  bool isBusy() const override { return false; }

 private:
  static PlatformError refusal() {
    return PlatformError(std::make_error_code(std::errc::not_supported));
  }

  MainQueue& queue_;
};

class NoCenters final : public UserNotificationCenters {
 public:
  explicit NoCenters(MainQueue& queue) : center_(queue) {}

  UserNotificationCenter& center(const NotificationSource&) override { return center_; }

 private:
  NoCenter center_;
};

}  // namespace

std::unique_ptr<UserNotificationCenters> noUserNotificationCenters(MainQueue& queue) {
  return std::make_unique<NoCenters>(queue);
}

}  // namespace Varnel::Platform::Bare
