// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <vector>

namespace Basalt {

/// A multiset of small values that can be default-constructed and compared: it holds a value as
/// often as it was inserted. Up to eight occurrences cost no allocation. A plain value; it is
/// searched from front to back, so keep it short.
///
///     Bag<int> bag;
///     bag.insert(7);
///     bag.insert(7);
///     bag.remove(7);    // true
///     bag.contains(7);  // true: one is left
template <typename Element>
class Bag final {
 public:
  [[nodiscard]] std::size_t count() const { return count_; }

  [[nodiscard]] std::size_t count(const Element& element) const {
    std::size_t occurrences = 0;
    for (std::size_t i = 0; i < count_; ++i) occurrences += at(i) == element;
    return occurrences;
  }

  [[nodiscard]] bool contains(const Element& element) const { return find(element) != count_; }

  void insert(const Element& element) {
    if (count_ < few_.size())
      few_[count_] = element;
    else
      more_.push_back(element);
    ++count_;
  }

  /// Takes one occurrence out; false when there is none.
  bool remove(const Element& element) {
    const std::size_t found = find(element);
    if (found == count_) return false;
    at(found) = at(count_ - 1);
    --count_;
    if (count_ >= few_.size()) more_.pop_back();
    return true;
  }

 private:
  [[nodiscard]] const Element& at(std::size_t index) const {
    return index < few_.size() ? few_[index] : more_[index - few_.size()];
  }
  [[nodiscard]] Element& at(std::size_t index) {
    return index < few_.size() ? few_[index] : more_[index - few_.size()];
  }

  [[nodiscard]] std::size_t find(const Element& element) const {
    std::size_t index = 0;
    while (index < count_ && !(at(index) == element)) ++index;
    return index;
  }

  std::size_t count_ = 0;
  std::array<Element, 8> few_{};
  std::vector<Element> more_;  ///< What does not fit into `few_`, in order.
};

}  // namespace Basalt
