// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The user's language and formats at present: "en" and "en_US" where none was chosen. Any thread.
class VARNEL_API UserLocale {
 public:
  virtual ~UserLocale() = default;
  UserLocale& operator=(const UserLocale&) = delete;

  /// The languages the user prefers, best first, as BCP 47 tags ("en-US"); never empty.
  [[nodiscard]] virtual std::vector<std::string> languages() const = 0;

  /// The locale of dates and the calendar, as an ICU identifier ("de_AT").
  [[nodiscard]] virtual std::string identifier() const = 0;

  /// The locale of numbers, as an ICU identifier; often the same.
  [[nodiscard]] virtual std::string numberIdentifier() const = 0;
};

}  // namespace Varnel::Platform
