// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// `orvane menu`: lists the accessibility identifiers of the main menu, for scripts that automate
/// the interface.
struct MenuCommand {
  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
