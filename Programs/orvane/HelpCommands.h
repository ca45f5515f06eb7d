// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <orvane/Completion.h>

namespace Orvane {

class Console;

/// `orvane help`: explains the program, or a command.
struct HelpCommand {
  std::vector<std::string> words;  ///< Of the command's name.

  /// Runs the command and returns the program's exit status: 2 when there is no such command.
  [[nodiscard]] int run(Console& console) const;
};

/// `orvane manual`: prints the manual page.
struct ManualCommand {
  [[nodiscard]] int run(Console& console) const;
};

/// `orvane completion`: prints the script by which a shell completes the program's arguments.
struct CompletionCommand {
  Shell shell = Shell::bash;

  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
