// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/NotificationCenter.h>

#include <atomic>
#include <mutex>
#include <utility>
#include <vector>

namespace Basalt {

struct NotificationCenter::State {
  std::mutex mutex;  ///< Owns the list; not held while handlers run.
  std::vector<std::shared_ptr<Observer::Subscription>> subscriptions;
};

struct NotificationCenter::Observer::Subscription {
  std::string name;
  Handler handler;
  std::weak_ptr<State> center;
  std::atomic<bool> isDropped = false;
};

NotificationCenter::Observer::Observer(std::shared_ptr<Subscription> subscription)
    : subscription_(std::move(subscription)) {}

NotificationCenter::Observer::Observer(Observer&&) noexcept = default;

NotificationCenter::Observer& NotificationCenter::Observer::operator=(Observer&& other) noexcept {
  Observer former(std::move(other));
  std::swap(subscription_, former.subscription_);
  return *this;
}

NotificationCenter::Observer::~Observer() {
  if (!subscription_) return;
  subscription_->isDropped = true;
  if (const auto center = subscription_->center.lock()) {
    const std::lock_guard lock(center->mutex);
    std::erase(center->subscriptions, subscription_);
  }
}

NotificationCenter::NotificationCenter() : state_(std::make_shared<State>()) {}
NotificationCenter::~NotificationCenter() = default;

NotificationCenter& NotificationCenter::defaultCenter() {
  static NotificationCenter& center = *new NotificationCenter;
  return center;
}

NotificationCenter::Observer NotificationCenter::addObserver(std::string name, Handler handler) {
  auto subscription = std::make_shared<Observer::Subscription>();
  subscription->name = std::move(name);
  subscription->handler = std::move(handler);
  subscription->center = state_;
  const std::lock_guard lock(state_->mutex);
  state_->subscriptions.push_back(subscription);
  return Observer(std::move(subscription));
}

void NotificationCenter::post(const Notification& notification) const {
  std::vector<std::shared_ptr<Observer::Subscription>> interested;
  {
    const std::lock_guard lock(state_->mutex);
    for (const auto& subscription : state_->subscriptions)
      if (subscription->name == notification.name) interested.push_back(subscription);
  }
  for (const auto& subscription : interested)
    if (!subscription->isDropped) subscription->handler(notification);
}

}  // namespace Basalt
