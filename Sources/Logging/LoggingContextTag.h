// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include <Varnel/Logging/LoggedError.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

class Logger;

/// A fact beside a log entry's message; all of an entry's tags stand on one line below it.
///
///     logger.log("Did finish", "Scanner", {LoggingContextTag::jobDescription("scan"),
///                                          LoggingContextTag::location(folder)});
///
/// In the entry control characters show escaped ("\n", "\x1B"): no file name breaks the line.
///
/// An immutable value. Errors are kept as the texts they had when the tag was made.
class VARNEL_API LoggingContextTag final {
 public:
  enum class Case { location, originalErrorType, underlyingError, jobDescription };

  /// The file or folder concerned. In anonymous mode its path stays out of the log.
  [[nodiscard]] static LoggingContextTag location(Platform::URL url);
  /// The type of the error that the logged one was made from, by name or by an error of the type.
  [[nodiscard]] static LoggingContextTag originalErrorType(std::string typeName);
  [[nodiscard]] static LoggingContextTag originalErrorType(const LoggedError& error);
  /// The error that led to the logged one.
  [[nodiscard]] static LoggingContextTag underlyingError(const LoggedError& error);
  /// What was being done.
  [[nodiscard]] static LoggingContextTag jobDescription(std::string text);

  [[nodiscard]] Case case_() const { return kind_; }

  /// "job: scan", "location: /home/ada/Music" and so on, locations as this logger writes them.
  /// Absent for a location without a text in anonymous mode.
  [[nodiscard]] std::optional<std::string> text(const Logger& logger) const;

 private:
  using Payload = std::variant<std::string, Platform::URL>;

  LoggingContextTag(Case kind, Payload payload) : kind_(kind), payload_(std::move(payload)) {}

  Case kind_;
  Payload payload_;
};

using LoggingContextTags = std::vector<LoggingContextTag>;

}  // namespace Varnel
