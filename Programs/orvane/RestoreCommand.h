// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

namespace Orvane {

class Console;

/// `orvane restore`: puts back what `orvane trash` has moved.
struct RestoreCommand {
  std::optional<std::int64_t> number;  ///< Of the removal; the last one without it.
  bool lists = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
