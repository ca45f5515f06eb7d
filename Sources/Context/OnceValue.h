// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <optional>

namespace Varnel {

/// A value that its first reader computes, and that is kept from then on.
///
///     const std::string& name() const { return name_.get([&] { return findName(); }); }
///
/// Any thread; other readers wait for the first. An exception of `compute` reaches that reader, and
/// the next one computes again. `compute` must not read the value itself.
template <typename Value>
class OnceValue final {
 public:
  template <typename Compute>
  const Value& get(Compute compute) const {
    std::call_once(once_, [&] { value_ = compute(); });
    return *value_;
  }

 private:
  mutable std::once_flag once_;
  mutable std::optional<Value> value_;
};

}  // namespace Varnel
