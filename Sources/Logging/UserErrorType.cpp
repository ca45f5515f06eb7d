// SPDX-License-Identifier: MIT
#include <Varnel/Logging/UserErrorType.h>

namespace Varnel {

std::optional<Platform::PlatformError> UserErrorType::userError() const {
  const auto info = userErrorInfo();
  if (!info) return std::nullopt;
  return info->error(domain(), code());
}

}  // namespace Varnel
