// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform {

/// The calendar of most regions, counted on into the years before there was one. It needs no
/// library of locales, whose own reads hundreds of kilobytes before it counts.
///
///     GregorianCalendar().adding(0, 1, 0, /* 31 January 2025 */ time);  // 28 February
class GregorianCalendar final : public LocaleLibrary::WallCalendar {
 public:
  [[nodiscard]] std::optional<Time> adding(std::int32_t years, std::int32_t months,
                                           std::int32_t days, Time time) const override;
  [[nodiscard]] int weekdayCount() const override { return 7; }
};

}  // namespace Varnel::Platform
