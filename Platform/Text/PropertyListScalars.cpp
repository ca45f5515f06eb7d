// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListScalars.h>

#include <algorithm>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <optional>
#include <system_error>

namespace Varnel::Platform {
namespace {

constexpr std::string_view blanks = " \t\r\n";

std::string_view trimmed(std::string_view text) {
  text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
  return text.substr(0, text.find_last_not_of(blanks) + 1);
}

bool take(std::string_view& text, std::string_view prefix) {
  if (!text.starts_with(prefix)) return false;
  text.remove_prefix(prefix.size());
  return true;
}

// The number that the whole text is.
template <typename Number, typename... Format>
std::optional<Number> numberOf(std::string_view text, Format... format) {
  Number number{};
  const char* const end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, number, format...);
  if (result.ec != std::errc() || result.ptr != end) return std::nullopt;
  return number;
}

}  // namespace

bool isWholeNumber(std::string_view text) {
  text = trimmed(text);
  const bool isNegative = take(text, "-");
  if (!isNegative) take(text, "+");
  const bool isHexadecimal = take(text, "0x") || take(text, "0X");
  // The parser takes them for octal.
  if (!isHexadecimal && text.size() > 1 && text.starts_with('0')) return false;
  const auto magnitude = numberOf<std::uint64_t>(text, isHexadecimal ? 16 : 10);
  constexpr std::uint64_t maxNegative = std::uint64_t{1} << 63;
  return magnitude && !(isNegative && *magnitude > maxNegative);
}

bool isReal(std::string_view text) {
  text = trimmed(text);
  if (take(text, "+") && text.starts_with('-')) return false;
  return numberOf<double>(text).has_value();
}

bool isDate(std::string_view text) {
  constexpr std::string_view form = "0000-00-00T00:00:00Z";
  if (text.size() != form.size()) return false;
  for (std::size_t index = 0; index < form.size(); ++index) {
    const bool isDigit = text[index] >= '0' && text[index] <= '9';
    if (form[index] == '0' ? !isDigit : text[index] != form[index]) return false;
  }
  const auto part = [text](std::size_t position, std::size_t length) {
    return *numberOf<unsigned>(text.substr(position, length));
  };
  using namespace std::chrono;
  const year_month_day day(year(static_cast<int>(part(0, 4))), month(part(5, 2)),
                           std::chrono::day(part(8, 2)));
  return day.ok() && part(11, 2) < 24 && part(14, 2) < 60 && part(17, 2) < 60;
}

}  // namespace Varnel::Platform
