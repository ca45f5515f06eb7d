// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserDefaults.h>

#include <charconv>
#include <string_view>

#include <fmt/format.h>

#include <Varnel/Platform/Values/UTF8.h>

namespace Varnel::Platform {
namespace {

bool canBeText(std::string_view text) {
  return text.find('\0') == std::string_view::npos && isValidUTF8(text);
}

bool canBeKey(std::string_view text) {
  return !text.empty() && canBeText(text);
}

PlatformError invalidArgument() {
  return PlatformError(std::make_error_code(std::errc::invalid_argument));
}

struct Spelling {
  std::string operator()(const std::string& text) const { return text; }
  // Reals in the shortest form that reads as the same number.
  template <typename Type>
  std::string operator()(Type value) const {
    return fmt::format("{}", value);
  }
};

// An editor leaves blanks.
std::string_view word(std::string_view text) {
  constexpr std::string_view blanks = " \t\r\n";
  const std::size_t begin = text.find_first_not_of(blanks);
  if (begin == std::string_view::npos) return {};
  return text.substr(begin, text.find_last_not_of(blanks) + 1 - begin);
}

template <typename Number>
std::optional<Number> numberIn(std::string_view text) {
  Number number{};
  const char* const end = text.data() + text.size();
  const auto [rest, failed] = std::from_chars(text.data(), end, number);
  if (failed != std::errc() || rest != end) return std::nullopt;
  return number;
}

}  // namespace

std::optional<bool> UserDefaults::truthValue(const std::string& key) const {
  const std::string kept = text(key).value_or("");
  const std::string_view spelled = word(kept);
  if (spelled == "true" || spelled == "1") return true;
  if (spelled == "false" || spelled == "0") return false;
  return std::nullopt;
}

std::optional<std::int64_t> UserDefaults::integer(const std::string& key) const {
  return numberIn<std::int64_t>(word(text(key).value_or("")));
}

std::optional<double> UserDefaults::real(const std::string& key) const {
  return numberIn<double>(word(text(key).value_or("")));
}

std::optional<std::string> UserDefaults::text(const std::string& key) const {
  return canBeKey(key) ? readText(key) : std::nullopt;
}

std::optional<PlatformError> UserDefaults::set(const std::string& key, const Value& value) {
  const std::string text = std::visit(Spelling(), value);
  if (!canBeKey(key) || !canBeText(text)) return invalidArgument();
  return writeText(key, text);
}

std::optional<PlatformError> UserDefaults::remove(const std::string& key) {
  return canBeKey(key) ? removeText(key) : invalidArgument();
}

}  // namespace Varnel::Platform
