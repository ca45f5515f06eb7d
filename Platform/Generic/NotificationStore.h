// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Generic/Delivery.h>
#include <Varnel/Platform/SQLite/DurableFile.h>
#include <Varnel/Platform/Values/NotificationSource.h>

namespace Varnel::Platform {

class Calendar;

/// What a product's notification center remembers: every delivery that is planned, and every one
/// that was made and has not been removed; who the product is; and the clicks for which it is being
/// started. It knows nothing of the running application, so that another program may deliver.
///
///     store.claimDue(now, calendar);
///     auto due = store.deliveries({DeliveryState::due});
///     if (!due) return tryLater(due.error());
///
/// One delivery of a key is planned at most, and one is due or in the delivered list. One thread at
/// a time; several processes may share the file. What fails has changed nothing.
class NotificationStore final {
 public:
  using Failure = std::optional<PlatformError>;  ///< None when it was done.

  /// A click is kept no longer, because whoever starts later did not start for it.
  static constexpr std::chrono::minutes maxLaunchAge{5};

  NotificationStore(DurableFile::Ports ports, const std::string& file, Migrating migrating);

  /// Does the calls on this store as one. They may be run more than once. What they throw comes out
  /// of this, and nothing is changed.
  [[nodiscard]] Failure change(const std::function<Failure()>& calls);

  /// The deliveries in these states, the latest first.
  [[nodiscard]] Result<std::vector<Delivery>> deliveries(const std::vector<DeliveryState>& states);

  /// Plans in the place of what is planned for the same identifier.
  [[nodiscard]] Failure plan(const UserNotification& notification, Date now,
                             const Calendar& calendar);

  /// Makes due what is planned for now or earlier, and plans the next of what repeats.
  [[nodiscard]] Failure claimDue(Date now, const Calendar& calendar);
  /// Makes a notification due that was not planned.
  [[nodiscard]] Failure makeDue(const UserNotification& notification, Date now);
  /// Decides of due deliveries, by their numbers: each is to be shown, or is hidden. Returns those
  /// that were due still, the earliest first.
  [[nodiscard]] Result<std::vector<Delivery>> decideDue(const std::map<std::int64_t, bool>& toShow);

  /// Notes the banner of a delivery. False when the delivery has been removed meanwhile.
  [[nodiscard]] Result<bool> noteShown(std::int64_t number, const std::string& banner);
  /// Notes that there is no banner any more.
  [[nodiscard]] Failure noteGone(std::int64_t number);
  /// Notes that whoever showed banners has ended, and hears of no click on them any more.
  [[nodiscard]] Failure noteAllExpired();
  /// Forgets the delivery, once its banner is gone if it has one.
  [[nodiscard]] Failure remove(std::int64_t number);

  /// Keeps who plans here.
  [[nodiscard]] Failure keepSource(const NotificationSource& source);
  [[nodiscard]] Result<std::optional<NotificationSource>> source();

  /// Keeps a click for the application, which is not running.
  [[nodiscard]] Failure keepLaunch(const UserNotification& notification, Date now);
  /// The earliest such click, for one taker alone.
  [[nodiscard]] Result<std::optional<UserNotification>> takeLaunch(Date now);

 private:
  [[nodiscard]] Failure read(const DurableFile::Work& work);
  [[nodiscard]] Failure write(const DurableFile::Work& work);

  DurableFile file_;
  SQLiteDatabase* open_ = nullptr;  ///< While calls are done as one.
};

}  // namespace Varnel::Platform
