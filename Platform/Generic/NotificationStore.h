// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Generic/NotificationSchedule.h>
#include <Varnel/Platform/SQLite/DurableFile.h>
#include <Varnel/Platform/Values/UserNotification.h>

namespace Varnel::Platform {

class Calendar;

/// Where a delivery stands. Only planned ones have a date ahead; the delivered list is hidden,
/// toShow, shown and expired.
enum class DeliveryState {
  planned,
  due,      ///< Its date has come; whether to show it has yet to be asked.
  hidden,   ///< Delivered without a banner, for good.
  toShow,   ///< Delivered; its banner has yet to come.
  shown,    ///< Its banner has come.
  expired,  ///< Its banner has gone by itself, or with a click.
  removed   ///< It counts no more; its banner has yet to be closed.
};

/// One delivery of a notification. A plain value.
struct Delivery final {
  std::int64_t number = 0;  ///< Names it, for ever.
  DeliveryState state = DeliveryState::planned;
  NotificationSchedule schedule;
  /// The server's reference of its banner. Until that is shown, and in a hidden one: of the banner
  /// of its predecessor, which it replaces.
  std::optional<std::string> banner = std::nullopt;
};

/// What a product's notification center remembers: every delivery that is planned, and every one
/// that was made and has not been removed. It knows nothing of the running application, so that any
/// program of the product may deliver.
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

  NotificationStore(DurableFile::Ports ports, const std::string& file);

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
  /// Decides of due deliveries: each is to be shown, or is hidden.
  [[nodiscard]] Failure decideDue(const std::vector<std::pair<std::int64_t, bool>>& isToShow);

  /// Notes the banner of a delivery. False when the delivery has been removed meanwhile.
  [[nodiscard]] Result<bool> noteShown(std::int64_t number, const std::string& banner);
  /// Notes that there is no banner any more.
  [[nodiscard]] Failure noteGone(std::int64_t number);
  /// Forgets the delivery, once its banner is gone if it has one.
  [[nodiscard]] Failure remove(std::int64_t number);

 private:
  [[nodiscard]] Failure read(const DurableFile::Work& work);
  [[nodiscard]] Failure write(const DurableFile::Work& work);

  DurableFile file_;
  SQLiteDatabase* open_ = nullptr;  ///< While calls are done as one.
};

}  // namespace Varnel::Platform
