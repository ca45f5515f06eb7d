// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LogEntry.h>

namespace Varnel::LogEntry {
namespace {

std::string_view lastPathComponent(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

}  // namespace

Buffer text(std::string_view timestamp, std::string_view author, std::string_view message,
            std::span<const std::string> items) {
  // Piece by piece, without parsing a format: this runs for every entry, on the caller's time.
  Buffer entry;
  const auto add = [&entry](std::string_view piece) {
    entry.append(piece.data(), piece.data() + piece.size());
  };
  add("[");
  add(timestamp);
  add("] ");
  add(author);
  add(":  ");
  add(message);
  std::string_view separator = nextLinePrefix;
  for (const std::string& item : items) {
    add(separator);
    add(item);
    separator = ", ";
  }
  add("\n");
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
