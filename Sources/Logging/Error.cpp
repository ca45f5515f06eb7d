// SPDX-License-Identifier: MIT
#include <Varnel/Logging/Error.h>

namespace Varnel {

std::string Error::domain() const {
  return "Varnel." + std::string(typeName());
}

Platform::PlatformError Error::platformError() const {
  return {domain(), code()};
}

std::string Error::description() const {
  return platformError().description();
}

}  // namespace Varnel
