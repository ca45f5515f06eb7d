// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Basalt {

/// Something that happened, told to those that observe its name.
struct Notification {
  std::string name;
  Varnel::Platform::PropertyDictionary userInfo;
};

/// Passes notifications on to the observers of their name.
///
///     auto token = NotificationCenter::defaultCenter().addObserver(
///         "NSWorkspaceDidMountNotification", [](const Notification&) { refresh(); });
///
/// Any thread. Handlers run on the posting thread, in the order in which they were added, and may
/// add and drop observers and post. They must not throw.
class VARNEL_API NotificationCenter final {
 public:
  using Handler = std::function<void(const Notification&)>;

  /// Keeps an observer subscribed. Once it is gone the handler is not called any more, although a
  /// call on another thread may still be under way. It may outlive its center.
  class VARNEL_API Observer final {
   public:
    Observer(Observer&&) noexcept;
    Observer& operator=(Observer&&) noexcept;
    ~Observer();

   private:
    friend NotificationCenter;
    struct Subscription;
    explicit Observer(std::shared_ptr<Subscription> subscription);
    std::shared_ptr<Subscription> subscription_;
  };

  NotificationCenter();
  ~NotificationCenter();
  NotificationCenter(const NotificationCenter&) = delete;
  NotificationCenter& operator=(const NotificationCenter&) = delete;

  /// The process's own center, made on first use and never destroyed.
  [[nodiscard]] static NotificationCenter& defaultCenter();

  [[nodiscard]] Observer addObserver(std::string name, Handler handler);

  /// Calls the handlers that observe this name now; those that they add wait for the next time.
  void post(const Notification& notification) const;

 private:
  struct State;
  const std::shared_ptr<State> state_;
};

}  // namespace Basalt
