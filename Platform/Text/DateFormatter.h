// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include <Platform/Api.h>
#include <Platform/Values/Date.h>

namespace Varnel::Platform {

/// Writes dates by a pattern of Unicode Technical Standard #35, in the process's time zone.
///
///     DateFormatter("YYYY-MM-dd HH:mm:ss", "en_US").string(clock.now());
///
/// Note that "YYYY" is the year of the locale's week, not the calendar's. Immutable; any thread.
/// Text of the same second as the call before is not computed again when the pattern has no finer
/// unit.
class VARNEL_API DateFormatter final {
 public:
  DateFormatter(std::string_view pattern, std::string_view localeIdentifier);
  ~DateFormatter();
  DateFormatter(const DateFormatter&) = delete;
  DateFormatter& operator=(const DateFormatter&) = delete;

  [[nodiscard]] std::string string(Date date) const;

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace Varnel::Platform
