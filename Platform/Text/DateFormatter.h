// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

class TimeZones;

/// Writes dates by a pattern of Unicode Technical Standard #35, in the time zone where the user was
/// when the formatter was made.
///
///     DateFormatter("YYYY-MM-dd HH:mm:ss", "en_US", timeZones).string(clock.now());
///
/// Note that "YYYY" is the year of the locale's week, not the calendar's. Immutable; any thread.
/// When the pattern has no unit below a second, two dates of one second in a row are formatted
/// once.
class VARNEL_API DateFormatter final {
 public:
  /// A pattern that cannot be used is replaced by "yyyy-MM-dd HH:mm:ss", and an unknown locale (an
  /// ICU identifier) by the nearest known one.
  DateFormatter(std::string_view pattern, std::string_view localeIdentifier,
                const TimeZones& timeZones);
  ~DateFormatter();
  DateFormatter(const DateFormatter&) = delete;
  DateFormatter& operator=(const DateFormatter&) = delete;

  /// The text of the date, in UTF-8.
  [[nodiscard]] std::string string(Date date) const;

  /// Writes that text into `room` and returns its bytes, as strftime() does; 0 when it does not
  /// fit. Allocates nothing where the text is not formatted anew and has at most 48 bytes.
  std::size_t write(Date date, std::span<char> room) const;

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace Varnel::Platform
