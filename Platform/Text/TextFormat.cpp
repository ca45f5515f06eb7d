// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/TextFormat.h>

#include <charconv>

namespace Varnel::Platform {
namespace {

// The position that "2$@…" names, counted from 0, which is removed from `rest`; or none.
std::size_t takePosition(std::string_view& rest) {
  std::size_t position = 0;
  const auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), position, 10);
  const auto length = static_cast<std::size_t>(end - rest.data());
  if (error != std::errc() || position == 0 || !rest.substr(length).starts_with("$@"))
    return std::string_view::npos;
  rest.remove_prefix(length + 2);
  return position - 1;
}

}  // namespace

std::string formatted(std::string_view format, std::initializer_list<std::string_view> texts) {
  std::string result;
  std::size_t next = 0;
  const auto append = [&](std::size_t position) {
    result += position < texts.size() ? texts.begin()[position] : "(null)";
  };
  while (true) {
    const std::size_t percent = format.find('%');
    result += format.substr(0, percent);
    if (percent == std::string_view::npos) return result;
    format.remove_prefix(percent + 1);
    if (format.starts_with('%')) {
      format.remove_prefix(1);
      result += '%';
    } else if (format.starts_with('@')) {
      format.remove_prefix(1);
      append(next++);
    } else if (const std::size_t position = takePosition(format);
               position != std::string_view::npos) {
      append(position);
    } else {
      result += '%';
    }
  }
}

}  // namespace Varnel::Platform
