// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LoggingContextTag.h>

#include <utility>

#include <Varnel/Logging/Logger.h>

namespace Varnel {

LoggingContextTag LoggingContextTag::location(Platform::URL url) {
  return {Case::location, std::move(url)};
}

LoggingContextTag LoggingContextTag::originalErrorType(std::string typeName) {
  return {Case::originalErrorType, std::move(typeName)};
}

LoggingContextTag LoggingContextTag::originalErrorType(const LoggedError& error) {
  return {Case::originalErrorType, error.typeName()};
}

LoggingContextTag LoggingContextTag::underlyingError(const LoggedError& error) {
  return {Case::underlyingError, error.description()};
}

LoggingContextTag LoggingContextTag::jobDescription(std::string text) {
  return {Case::jobDescription, std::move(text)};
}

std::optional<std::string> LoggingContextTag::text(const Logger& logger) const {
  if (const auto* url = std::get_if<Platform::URL>(&payload_)) {
    const auto location = logger.stringForFileURL(*url);
    if (!location) return std::nullopt;
    return "location: " + *location;
  }
  const std::string& text = *std::get_if<std::string>(&payload_);
  switch (kind_) {
    case Case::originalErrorType:
      return "originally: " + text;
    case Case::underlyingError:
      return "underlying error: " + text;
    case Case::location:
    case Case::jobDescription:
      break;
  }
  return "job: " + text;
}

}  // namespace Varnel
