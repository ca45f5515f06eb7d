// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {

/// Gives a variable its present value back at the end of the block, also where an exception ends
/// that. The variable outlives it.
///
///     const Restorer before(isOccupied_);
///     isOccupied_ = true;
///     return calls();
template <typename Value>
class Restorer final {
 public:
  explicit Restorer(Value& variable) : variable_(&variable), before_(variable) {}
  ~Restorer() {
    if (variable_) *variable_ = before_;
  }
  Restorer(const Restorer&) = delete;
  Restorer& operator=(const Restorer&) = delete;

  /// Leaves the variable as it is.
  void dismiss() { variable_ = nullptr; }

 private:
  Value* variable_;
  const Value before_;
};

}  // namespace Varnel::Platform
