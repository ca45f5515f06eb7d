// SPDX-License-Identifier: MIT
#include <Varnel/Logging/UserErrorInfo.h>

#include <utility>

namespace Varnel {

UserErrorInfo::UserErrorInfo(std::string description, std::string suggestion,
                             std::vector<std::string> options, Platform::ErrorUserInfo info)
    : errorDescription(std::move(description)),
      recoverySuggestion(std::move(suggestion)),
      recoveryOptions(std::move(options)),
      userInfo(std::move(info)) {}

Platform::PlatformError UserErrorInfo::error(std::string domain, long code) const {
  Platform::ErrorUserInfo facts = userInfo;
  const auto put = [&facts](std::string_view key, const auto& value) {
    facts.insert_or_assign(std::string(key), value);
  };
  put(Platform::localizedDescriptionKey, errorDescription);
  put(Platform::localizedRecoverySuggestionKey, recoverySuggestion);
  put(Platform::localizedRecoveryOptionsKey, recoveryOptions);
  return {std::move(domain), code, std::move(facts)};
}

}  // namespace Varnel
