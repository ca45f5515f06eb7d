// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel {

/// The texts with which an alert tells the user of an error.
///
///     UserErrorInfo info{"The folder is gone.", "Choose another folder.", {"OK"}};
struct VARNEL_API UserErrorInfo {
  std::string errorDescription;              ///< The main sentence.
  std::string recoverySuggestion;            ///< The secondary sentence.
  std::vector<std::string> recoveryOptions;  ///< The titles of the alert's buttons, in order.
  Platform::ErrorUserInfo userInfo;          ///< Further facts for the platform error.

  UserErrorInfo(std::string errorDescription, std::string recoverySuggestion,
                std::vector<std::string> recoveryOptions = {},
                Platform::ErrorUserInfo userInfo = {});

  /// A platform error that carries all this under the keys of `PlatformError.h`. Where `userInfo`
  /// holds one of the three localized keys too, the field of this record wins.
  [[nodiscard]] Platform::PlatformError error(std::string domain, long code) const;
};

}  // namespace Varnel
