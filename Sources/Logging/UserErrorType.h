// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include <Varnel/Logging/Error.h>
#include <Varnel/Logging/UserErrorInfo.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// An error that may have something to tell the user.
///
///     if (auto shown = error.userError()) presentAlert(*shown);
class VARNEL_API UserErrorType : public Error {
 public:
  /// The texts for the user; absent when the error does not concern the user.
  [[nodiscard]] virtual std::optional<UserErrorInfo> userErrorInfo() const = 0;

  /// The platform error of this error's domain and code with those texts; absent without them.
  [[nodiscard]] std::optional<Platform::PlatformError> userError() const;
};

}  // namespace Varnel
