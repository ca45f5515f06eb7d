// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// `orvane identify`: prints the identifiers by which the suite recognises this installation.
struct IdentifyCommand {
  bool isJSON = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
