// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// `orvane disks`: lists the disks, what they are, how many threads may read each at once, and the
/// volumes on them.
struct DisksCommand {
  bool isJSON = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
