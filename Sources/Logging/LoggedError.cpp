// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LoggedError.h>

#include <Varnel/Logging/CustomLogStringConvertible.h>
#include <Varnel/Logging/ErrorBridging.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Varnel {
namespace {

// Descriptions often quote file names, which may hold anything.
std::string visibleLogDescription(const Platform::PlatformError& error) {
  return Platform::visibleText(logDescription(error), Platform::Backslashes::kept);
}

// The text of the error itself where it has one, else that of its platform error.
template <typename Polymorphic, typename Bridge>
std::string logDescriptionOf(const Polymorphic& error, Bridge bridge) {
  if (const auto* own = dynamic_cast<const CustomLogStringConvertible*>(&error))
    return own->logDescription();
  return visibleLogDescription(bridge(error));
}

}  // namespace

LoggedError::LoggedError(const Error& error)
    : typeName_(error.typeName()),
      logDescription_(
          logDescriptionOf(error, [](const Error& own) { return own.platformError(); })),
      description_(error.description()) {}

LoggedError::LoggedError(const Platform::PlatformError& error)
    : typeName_("PlatformError"),
      logDescription_(visibleLogDescription(error)),
      description_(error.description()) {}

LoggedError::LoggedError(const std::exception& exception) {
  if (const auto* error = dynamic_cast<const Error*>(&exception)) {
    *this = LoggedError(*error);
    return;
  }
  typeName_ = Varnel::typeName(exception);
  logDescription_ = logDescriptionOf(exception, platformError);
  description_ = exception.what();
}

LoggedError::LoggedError(std::error_code code) : LoggedError(Platform::PlatformError(code)) {
  typeName_ = "error_code";
}

}  // namespace Varnel
