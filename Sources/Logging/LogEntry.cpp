// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LogEntry.h>

#include <fmt/format.h>

namespace Varnel::LogEntry {
namespace {

std::string_view lastPathComponent(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

}  // namespace

std::string text(std::string_view timestamp, std::string_view author, std::string_view message,
                 std::span<const std::string> items) {
  constexpr std::string_view afterAuthor = ":  ";
  std::size_t size = 4 + timestamp.size() + author.size() + afterAuthor.size() + message.size();
  for (const std::string& item : items) size += nextLinePrefix.size() + item.size();

  // Appended piece by piece: this runs for every entry, on the caller's time.
  std::string entry;
  entry.reserve(size);
  entry += '[';
  entry += timestamp;
  entry += "] ";
  entry += author;
  entry += afterAuthor;
  entry += message;
  std::string_view separator = nextLinePrefix;
  for (const std::string& item : items) {
    entry += separator;
    entry += item;
    separator = ", ";
  }
  entry += '\n';
  return entry;
}

std::string errorMessage(const LoggedError& error, const SourcePosition& where) {
  return fmt::format("[{}] {}{}{}:{} -- {}", error.typeName(), error.logDescription(),
                     nextLinePrefix, lastPathComponent(where.file), where.line,
                     functionText(where.function));
}

std::string functionText(std::string_view name) {
  constexpr std::string_view call = "operator()";
  // The "<" of an operator's own name is no argument list.
  if (name.starts_with(call))
    name = call;
  else if (!name.starts_with("operator"))
    name = name.substr(0, name.find('<'));
  return std::string(name) + "()";
}

}  // namespace Varnel::LogEntry
