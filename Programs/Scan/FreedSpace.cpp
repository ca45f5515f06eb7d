// SPDX-License-Identifier: MIT
#include <Scan/FreedSpace.h>

#include <algorithm>

namespace Orvane {

void FreedSpace::add(const FileSpace& file) {
  const bool isShared = file.shared && file.shared->bytes > 0;
  std::size_t index = units_.size();
  if (isShared) index = unitAt_.try_emplace(file.shared->place, index).first->second;
  if (index == units_.size()) units_.emplace_back();
  Unit& unit = units_[index];
  unit.bytes = file.bytes;
  unit.sharedBytes = isShared ? file.shared->bytes : 0;
  unit.isHeld = unit.isHeld || file.isHeld;
  ++unit.files;
}

std::uint64_t FreedSpace::Unit::freedBytes() const {
  if (isHeld) return 0;
  return files > 1 ? bytes : bytes - std::min(sharedBytes, bytes);
}

std::uint64_t FreedSpace::sum() const {
  std::uint64_t sum = 0;
  for (const Unit& unit : units_) sum += unit.freedBytes();
  return sum;
}

std::uint64_t FreedSpace::least() const {
  const auto least = std::min_element(
      units_.begin(), units_.end(),
      [](const Unit& a, const Unit& b) { return a.freedBytes() < b.freedBytes(); });
  return least == units_.end() ? 0 : least->freedBytes();
}

}  // namespace Orvane
