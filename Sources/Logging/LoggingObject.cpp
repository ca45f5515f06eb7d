// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LoggingObject.h>

#include <Varnel/Logging/Logger.h>

namespace Varnel {

Logger& LoggingObject::logger() const {
  return Logger::instance();
}

void LoggingObject::log(std::string_view message, const LoggingContextTags& tags,
                        SourcePosition where) const {
  logger().log(message, logAuthor(), tags, where);
}

void LoggingObject::log(std::string_view message, const std::optional<Platform::URL>& location,
                        SourcePosition where) const {
  logger().log(message, logAuthor(), location, where);
}

void LoggingObject::logError(const LoggedError& error, const LoggingContextTags& tags,
                             SourcePosition where) const {
  logger().logError(error, logAuthor(), tags, where);
}

void LoggingObject::logError(const LoggedError& error,
                             std::optional<std::string_view> jobDescription,
                             const std::optional<Platform::URL>& location,
                             SourcePosition where) const {
  logger().logError(error, logAuthor(), jobDescription, location, where);
}

}  // namespace Varnel
