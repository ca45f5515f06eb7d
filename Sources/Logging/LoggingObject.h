// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string_view>

#include <Varnel/Logging/LoggedError.h>
#include <Varnel/Logging/LoggingContextTag.h>
#include <Varnel/Logging/SourcePosition.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

class Logger;

/// An object that logs under a name of its own.
///
///     class Scanner final : public LoggingObject {
///       std::string_view logAuthor() const override { return "Scanner"; }
///       void run() { log("Did start"); }
///     };
///
/// The operations are those of `Logger`, with this object's author and the caller's place in the
/// source code. Any thread, if the two requirements allow it.
class VARNEL_API LoggingObject {
 public:
  virtual ~LoggingObject() = default;

  /// Where the entries go: to the process's logger unless a class overrides it.
  [[nodiscard]] virtual Logger& logger() const;

  /// The name in each entry: the name of the class, written out.
  [[nodiscard]] virtual std::string_view logAuthor() const = 0;

  void log(std::string_view message, const LoggingContextTags& tags = {},
           SourcePosition where = SourcePosition::current()) const;
  void log(std::string_view message, const std::optional<Platform::URL>& location,
           SourcePosition where = SourcePosition::current()) const;
  void logError(const LoggedError& error, const LoggingContextTags& tags = {},
                SourcePosition where = SourcePosition::current()) const;
  void logError(const LoggedError& error, std::optional<std::string_view> jobDescription,
                const std::optional<Platform::URL>& location = std::nullopt,
                SourcePosition where = SourcePosition::current()) const;
};

}  // namespace Varnel
