// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

namespace Orvane {

class Console;

/// `orvane path`: shows paths in their short form, "~/Documents/", or such forms in full.
struct PathCommand {
  std::vector<std::string> paths;
  bool expands = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
