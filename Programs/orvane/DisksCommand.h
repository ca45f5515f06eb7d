// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// `orvane disks`: lists the disks, what they are, how many threads may read each at once, and the
/// volumes on them. Live, it tells which processes of the session read which of them.
struct DisksCommand {
  bool isJSON = false;
  bool isLive = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
