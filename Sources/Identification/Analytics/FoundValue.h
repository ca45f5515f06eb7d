// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <optional>
#include <utility>

namespace Varnel {

/// A value that is looked for when it is first read, unless somebody has set it.
///
///     std::string name() { return name_.get([] { return findName(); }); }
///
/// Any thread. Who reads it first looks, however long that takes, and others that need the value
/// wait. Setting it never waits, and what was set meanwhile wins over what was found. `find` must
/// not read the value itself; what it throws reaches the reader, and the next one looks again.
template <typename Value>
class FoundValue final {
 public:
  template <typename Find>
  [[nodiscard]] Value get(Find find) {
    if (std::optional<Value> value = known()) return *std::move(value);
    const std::lock_guard looking(findMutex_);
    if (std::optional<Value> value = known()) return *std::move(value);
    Value found = find();
    const std::lock_guard lock(mutex_);
    if (!value_) value_ = std::move(found);
    return *value_;
  }

  void set(Value value) {
    const std::lock_guard lock(mutex_);
    value_ = std::move(value);
  }

 private:
  [[nodiscard]] std::optional<Value> known() {
    const std::lock_guard lock(mutex_);
    return value_;
  }

  std::mutex findMutex_;  ///< Held by the one that looks. Taken before `mutex_`.
  std::mutex mutex_;      ///< Owns the value.
  std::optional<Value> value_;
};

}  // namespace Varnel
