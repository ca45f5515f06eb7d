// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Values/PlatformError.h>

#include <utility>

#include <fmt/format.h>

namespace Varnel::Platform {

PlatformError::PlatformError(std::string domain, long code, ErrorUserInfo userInfo)
    : domain_(std::move(domain)), code_(code), userInfo_(std::move(userInfo)) {}

PlatformError::PlatformError(std::error_code code)
    : PlatformError(code.category().name(), code.value(),
                    {{std::string(localizedDescriptionKey), code.message()}}) {}

std::string PlatformError::localizedDescription() const {
  if (const auto found = userInfo_.find(localizedDescriptionKey); found != userInfo_.end()) {
    if (const auto* text = std::any_cast<std::string>(&found->second)) return *text;
  }
  return fmt::format("The operation couldn’t be completed. ({} error {}.)", domain_, code_);
}

std::string PlatformError::description() const {
  std::string text =
      fmt::format("Error Domain={} Code={} \"{}\"", domain_, code_, localizedDescription());
  if (const auto found = userInfo_.find(underlyingErrorKey); found != userInfo_.end()) {
    if (const auto* underlying = std::any_cast<PlatformError>(&found->second))
      text += fmt::format(" UserInfo={{{}={{{}}}}}", underlyingErrorKey, underlying->description());
  }
  return text;
}

}  // namespace Varnel::Platform
