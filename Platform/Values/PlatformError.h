// SPDX-License-Identifier: MIT
#pragma once

#include <any>
#include <map>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Further facts of an error, by key.
using ErrorUserInfo = std::map<std::string, std::any, std::less<>>;

/// Key of the sentence that names what went wrong (a `std::string`).
inline constexpr std::string_view localizedDescriptionKey = "NSLocalizedDescription";
/// Key of the sentence that tells what could be done about it (a `std::string`).
inline constexpr std::string_view localizedRecoverySuggestionKey = "NSLocalizedRecoverySuggestion";
/// Key of the titles of an alert's buttons, in order (a `std::vector<std::string>`).
inline constexpr std::string_view localizedRecoveryOptionsKey = "NSLocalizedRecoveryOptions";
/// Key of the error that led to this one (a `PlatformError`).
inline constexpr std::string_view underlyingErrorKey = "NSUnderlyingError";

/// The error that every other kind of error bridges to: a domain, a code within it, and further
/// facts by key. Some systems call this their common error object.
///
///     PlatformError error("Varnel.GenericError", 0);
///     log(error.description());  // Error Domain=Varnel.GenericError Code=0 "…"
///
/// A plain value; threads may share one as any other value.
class VARNEL_API PlatformError final {
 public:
  PlatformError(std::string domain, long code, ErrorUserInfo userInfo = {});

  /// A system's error code: the domain is its category's name, the text its message.
  explicit PlatformError(std::error_code code);

  [[nodiscard]] const std::string& domain() const { return domain_; }
  [[nodiscard]] long code() const { return code_; }
  [[nodiscard]] const ErrorUserInfo& userInfo() const { return userInfo_; }

  /// The text under `localizedDescriptionKey`, or a sentence made of domain and code.
  [[nodiscard]] std::string localizedDescription() const;

  /// `Error Domain=D Code=C "text"`, the text being `localizedDescription()`; with an underlying
  /// error, ` UserInfo={NSUnderlyingError={…}}` and that one's description follow.
  [[nodiscard]] std::string description() const;

 private:
  std::string domain_;
  long code_;
  ErrorUserInfo userInfo_;
};

}  // namespace Varnel::Platform
