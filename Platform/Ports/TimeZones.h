// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// How the clocks of one region run. Immutable; any thread.
class VARNEL_API TimeZone {
 public:
  struct Offset final {
    std::chrono::seconds fromUTC{0};  ///< Negative west of Greenwich.
    bool isDaylightSaving = false;

    bool operator==(const Offset&) const = default;
  };

  virtual ~TimeZone() = default;

  /// The difference between the zone's clocks and UTC at `date`.
  [[nodiscard]] virtual Offset offsetAt(Date date) const = 0;

  /// The first moment after `date` at which the offset may change; until then it is that of `date`.
  /// Absent when there is none.
  [[nodiscard]] virtual std::optional<Date> nextChange(Date date) const = 0;
};

/// The time zones that the system knows. Any thread.
///
///     const auto zone = timeZones.zone(timeZones.localIdentifier());
///     const auto clock = date + zone->offsetAt(date).fromUTC;
class VARNEL_API TimeZones {
 public:
  virtual ~TimeZones() = default;
  TimeZones& operator=(const TimeZones&) = delete;

  /// The user's present zone: its name in the time zone database ("Europe/Vienna"), or another text
  /// that `zone` understands. "UTC" when the system knows no such zone.
  [[nodiscard]] virtual std::string localIdentifier() const = 0;

  /// The zone with its present rules; never null. A zone that the system does not know runs on UTC.
  /// The result may outlive this object.
  [[nodiscard]] virtual std::shared_ptr<const TimeZone> zone(
      const std::string& identifier) const = 0;
};

}  // namespace Varnel::Platform
