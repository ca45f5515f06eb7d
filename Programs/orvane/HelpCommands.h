// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

namespace Orvane {

class Console;

/// `orvane help`: explains the program, or a command.
struct HelpCommand {
  std::vector<std::string> words;  ///< Of the command's name.

  /// Runs the command and returns the program's exit status: 2 when there is no such command.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
