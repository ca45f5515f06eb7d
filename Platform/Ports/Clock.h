// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform {

/// Tells the wall-clock time. Any thread.
///
/// Tests use a `SimulatedClock`, which stands still until it is moved.
class VARNEL_API Clock {
 public:
  virtual ~Clock() = default;
  Clock& operator=(const Clock&) = delete;

  /// The present moment; it jumps when the user sets the clock.
  [[nodiscard]] virtual Date now() const = 0;
};

}  // namespace Varnel::Platform
