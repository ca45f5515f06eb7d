// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Generic/NotificationSchedule.h>
#include <Varnel/Platform/Generic/NotificationStoreFile.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

class Calendar;
class SystemLog;

/// A delivered notification.
struct DeliveredNotification final {
  std::string key;  ///< Names it in the store.
  UserNotification notification;
  /// The server's name for its banner. Of one just delivered: for the banner it replaces.
  std::optional<std::string> bannerReference = std::nullopt;

  bool operator==(const DeliveredNotification&) const = default;
};

/// What a product's notification center remembers: schedules and the delivered list. It knows
/// nothing of the running application, so that any program of the product may deliver.
///
///     for (const auto& delivered : store.claimDue(now, calendar)) show(delivered);
///
/// One thread at a time; several processes may share the file. A failure is reported to the
/// system's log, and counts as "not done" or "nothing there".
class NotificationStore final {
 public:
  NotificationStore(std::filesystem::path file, SystemLog& systemLog);

  /// Keeps a schedule in the place of one with the same identifier.
  void schedule(const UserNotification& notification, Date now, const Calendar& calendar);
  [[nodiscard]] std::vector<NotificationSchedule> schedules();
  /// Whether the schedules could not be read the last time, so that there may be some.
  [[nodiscard]] bool isOutOfOrder() const { return isOutOfOrder_; }
  void removeSchedule(const std::string& key);

  /// Moves what is due to the delivered list, the earliest first. Each delivery is claimed by one
  /// caller, among all processes.
  [[nodiscard]] std::vector<DeliveredNotification> claimDue(Date now, const Calendar& calendar);

  /// Puts a notification in the delivered list, in the place of one with the same identifier.
  [[nodiscard]] DeliveredNotification addDelivered(const UserNotification& notification, Date now);
  /// The delivered list, the latest first.
  [[nodiscard]] std::vector<DeliveredNotification> delivered();
  void removeDelivered(const std::string& key);
  void setBannerReference(const std::string& key, const std::string& reference);

 private:
  NotificationStoreFile file_;
  bool isOutOfOrder_ = false;
};

}  // namespace Varnel::Platform
