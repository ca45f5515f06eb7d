// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <optional>

namespace Varnel {

/// A value computed by whoever reads it first and kept from then on. Any thread.
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
