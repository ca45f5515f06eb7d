// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/ByteCountFormatter.h>

#include <array>

#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform {
namespace {

struct Unit {
  std::string_view name;
  int maxDecimals;
};

constexpr std::array units{Unit{"KB", 0}, Unit{"MB", 1}, Unit{"GB", 2},
                           Unit{"TB", 2}, Unit{"PB", 2}, Unit{"EB", 2}};

struct Rounded {
  std::uint64_t whole;
  std::uint64_t fraction;  ///< The decimals as one number.
};

// Long division, digit by digit: the remainder is below 2^60, so that ten of it fit into 64 bits.
Rounded divide(std::uint64_t bytes, std::uint64_t unit, int decimals) {
  Rounded result{bytes / unit, 0};
  std::uint64_t remainder = bytes % unit;
  std::uint64_t fractionEnd = 1;
  for (int decimal = 0; decimal < decimals; ++decimal) {
    result.fraction = result.fraction * 10 + remainder * 10 / unit;
    remainder = remainder * 10 % unit;
    fractionEnd *= 10;
  }
  if (remainder >= unit - remainder && ++result.fraction == fractionEnd) {
    result.fraction = 0;
    ++result.whole;
  }
  return result;
}

std::string decimalText(std::uint64_t fraction, int decimals) {
  const std::string digits = std::to_string(fraction);
  std::string text(static_cast<std::size_t>(decimals) - digits.size(), '0');
  text += digits;
  text.erase(text.find_last_not_of('0') + 1);
  return text;
}

}  // namespace

ByteCountFormatter::ByteCountFormatter(std::string_view localeIdentifier) {
  const LocaleLibrary* const library = localeLibrary();
  auto separators =
      library ? library->separators(std::string(localeIdentifier)) : LocaleLibrary::Separators();
  groupingSeparator_ = std::move(separators.grouping);
  decimalSeparator_ = std::move(separators.decimal);
}

// Counts of one unit stay below 1024, so there is at most one group.
std::string ByteCountFormatter::wholeText(std::uint64_t number) const {
  std::string text = std::to_string(number);
  if (text.size() > 3) text.insert(text.size() - 3, groupingSeparator_);
  return text;
}

std::string ByteCountFormatter::string(std::int64_t count, ByteCountStyle style) const {
  if (count == 0) return "Zero KB";
  std::string text;
  if (count < 0) text += '-';
  // Negated as unsigned, because the lowest count has no positive counterpart.
  const auto bits = static_cast<std::uint64_t>(count);
  const std::uint64_t bytes = count < 0 ? 0 - bits : bits;
  const std::uint64_t step = unitStep(style);
  if (bytes < step) {
    text += wholeText(bytes);
    return text += bytes == 1 ? " byte" : " bytes";
  }

  std::uint64_t unitSize = step;
  auto unit = units.begin();
  Rounded value = divide(bytes, unitSize, unit->maxDecimals);
  // A number that rounds up to a full step is shown in the next unit.
  while (value.whole >= step) {
    unitSize *= step;
    ++unit;
    value = divide(bytes, unitSize, unit->maxDecimals);
  }
  text += wholeText(value.whole);
  if (value.fraction != 0)
    text.append(decimalSeparator_).append(decimalText(value.fraction, unit->maxDecimals));
  return text.append(" ").append(unit->name);
}

}  // namespace Varnel::Platform
