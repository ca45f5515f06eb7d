// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/LenientNumbers.h>

#include <algorithm>
#include <charconv>
#include <limits>
#include <string>
#include <string_view>

namespace Varnel {
namespace {

using Platform::PropertyValue;

bool isNegative(std::string_view digits) {
  return digits.starts_with('-');
}

// A number's text without what the parser refuses before it: blanks and a plus. Empty when neither
// digit nor point follows, so that "inf" and "nan" stay texts.
std::string_view numberIn(std::string_view text) {
  text.remove_prefix(std::min(text.find_first_not_of(" \t\n\r\f\v"), text.size()));
  if (text.starts_with('+')) text.remove_prefix(1);
  const std::size_t first = isNegative(text) ? 1 : 0;
  if (text.size() <= first || std::string_view("0123456789.").find(text[first]) == text.npos)
    return {};
  return text;
}

// The parser reports numbers too close to zero as it reports numbers too large. Which it is tells
// the place of the first digit that counts, as the exponent moves it.
bool isTiny(std::string_view number) {
  const std::size_t end = std::min(number.find_first_of("eE"), number.size());
  const std::string_view mantissa = number.substr(0, end);
  std::string_view digits = number.substr(std::min(end + 1, number.size()));
  if (digits.starts_with('+')) digits.remove_prefix(1);
  std::int32_t exponent = 0;
  const auto status = std::from_chars(digits.data(), digits.data() + digits.size(), exponent).ec;
  if (status == std::errc::result_out_of_range) return isNegative(digits);
  const auto point = static_cast<std::int64_t>(std::min(mantissa.find('.'), mantissa.size()));
  const auto first = static_cast<std::int64_t>(mantissa.find_first_of("123456789"));
  return point - first + exponent < 0;
}

// A number that does not fit becomes the largest or the smallest.
template <typename Number>
Number parse(std::string_view text, Number largest, Number smallest) {
  const std::string_view digits = numberIn(text);
  Number number = 0;
  const auto [end, status] = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (status == std::errc()) return number;
  if (status != std::errc::result_out_of_range || isTiny({digits.data(), end})) return 0;
  return isNegative(digits) ? smallest : largest;
}

constexpr std::int64_t maxInteger = std::numeric_limits<std::int64_t>::max();
constexpr std::int64_t minInteger = std::numeric_limits<std::int64_t>::min();

std::int64_t truncated(double number) {
  constexpr double twoTo63 = 9223372036854775808.0;
  if (number >= twoTo63) return maxInteger;
  if (number < -twoTo63) return minInteger;
  return number == number ? static_cast<std::int64_t>(number) : 0;
}

}  // namespace

double lenientReal(const PropertyValue& value) {
  if (const auto* real = value.as<double>()) return *real;
  if (const auto* integer = value.as<std::int64_t>()) return static_cast<double>(*integer);
  if (const auto* truth = value.as<bool>()) return *truth ? 1 : 0;
  constexpr double largest = std::numeric_limits<double>::max();
  if (const auto* text = value.as<std::string>()) return parse(*text, largest, -largest);
  return 0;
}

std::int64_t lenientInteger(const PropertyValue& value) {
  if (const auto* integer = value.as<std::int64_t>()) return *integer;
  if (const auto* real = value.as<double>()) return truncated(*real);
  if (const auto* truth = value.as<bool>()) return *truth ? 1 : 0;
  if (const auto* text = value.as<std::string>()) return parse(*text, maxInteger, minInteger);
  return 0;
}

}  // namespace Varnel
