// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>

#include <fmt/format.h>

#include <Varnel/Logging/LoggedError.h>
#include <Varnel/Logging/SourcePosition.h>

/// The texts of the log, as functions of nothing but their arguments.
namespace Varnel::LogEntry {

/// Starts each further line of an entry.
inline constexpr std::string_view nextLinePrefix = "\n\t\t\t\t\t";

/// Holds an ordinary entry without allocation.
using Buffer = fmt::basic_memory_buffer<char, 512>;

/// A whole entry with its final line feed: the first line, and a line of the items if there are
/// any.
[[nodiscard]] Buffer text(std::string_view timestamp, std::string_view author,
                          std::string_view message, std::span<const std::string> items);

/// The message of an error's entry: what it is, and below it the place in the code.
[[nodiscard]] std::string errorMessage(const LoggedError& error, const SourcePosition& where);

/// The function of a code location, "run()" for the name "run". Names of template instances, which
/// some compilers give with their arguments ("run<int>"), lose those.
[[nodiscard]] std::string functionText(std::string_view name);

}  // namespace Varnel::LogEntry
