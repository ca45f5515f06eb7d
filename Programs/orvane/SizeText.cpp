// SPDX-License-Identifier: MIT
#include <orvane/SizeText.h>

#include <charconv>
#include <optional>
#include <string_view>

namespace Orvane {
namespace {

/// How many bytes the unit stands for; none when there is no such unit.
std::optional<std::uint64_t> unitOf(std::string_view text) {
  std::string unit;
  for (const char letter : text)
    unit += letter >= 'a' && letter <= 'z' ? static_cast<char>(letter - 'a' + 'A') : letter;
  if (unit.empty() || unit == "B" || unit == "BYTES") return 1;
  constexpr std::string_view letters = "KMGTPE";
  const std::size_t power = letters.find(unit[0]);
  const bool isBinary = unit.substr(1) == "IB";
  if (power == std::string_view::npos || (!isBinary && unit.size() > 1 && unit.substr(1) != "B"))
    return std::nullopt;
  std::uint64_t bytes = 1;
  for (std::size_t i = 0; i <= power; ++i) bytes *= isBinary ? 1024 : 1000;
  return bytes;
}

}  // namespace

Complaint readSize(const std::string& text, std::uint64_t& bytes) {
  const char* const end = text.data() + text.size();
  std::uint64_t count = 0;
  const auto [stop, status] = std::from_chars(text.data(), end, count);
  std::string_view unit(stop, static_cast<std::size_t>(end - stop));
  if (unit.size() > 1 && unit.starts_with(' ')) unit.remove_prefix(1);
  const auto factor = unitOf(unit);
  if (status == std::errc::invalid_argument || !factor)
    return "\"" + text + "\" is no size; 4096, 10M and 4KiB are";
  if (status == std::errc::result_out_of_range || __builtin_mul_overflow(count, *factor, &bytes))
    return "\"" + text + "\" is more than there can be";
  return std::nullopt;
}

}  // namespace Orvane
