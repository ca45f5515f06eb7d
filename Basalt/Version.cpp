// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Version.h>

#include <charconv>
#include <limits>

namespace Basalt {

Version::Version(std::string_view text) {
  const char* position = text.data();
  const char* const end = text.data() + text.size();
  while (position != end) {
    unsigned number = 0;
    const auto [next, status] = std::from_chars(position, end, number);
    if (status == std::errc::invalid_argument) break;
    if (status == std::errc::result_out_of_range) number = std::numeric_limits<unsigned>::max();
    components_.push_back(number);
    if (next == end || *next != '.') break;
    position = next + 1;
  }
  // Without trailing zeros, versions compare as their vectors do.
  while (!components_.empty() && components_.back() == 0) components_.pop_back();
}

unsigned Version::component(std::size_t index) const {
  return index < components_.size() ? components_[index] : 0;
}

std::string Version::string() const {
  if (components_.empty()) return "0";
  std::string text;
  for (const unsigned number : components_) {
    if (!text.empty()) text += '.';
    text += std::to_string(number);
  }
  return text;
}

}  // namespace Basalt
