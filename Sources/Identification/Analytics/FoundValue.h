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
/// Any thread. The first reader looks for the value, however long that takes; other readers wait.
/// Setting it never waits, and a value that was set meanwhile wins over the one that was found.
/// `find` must not read the value itself. Its exception reaches the reader, and the next reader
/// looks again.
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

  std::mutex findMutex_;  ///< Held by the thread that looks. Taken before `mutex_`.
  std::mutex mutex_;      ///< Owns the value.
  std::optional<Value> value_;
};

}  // namespace Varnel
