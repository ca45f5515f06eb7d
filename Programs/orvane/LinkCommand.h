// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace Orvane {

class Console;

/// `orvane link`: prints a link through the redirect service.
struct LinkCommand {
  std::optional<std::string> action;  ///< With one, the words are parameters of the service.
  std::vector<std::string> words;     ///< Otherwise they are the one URL to decorate.

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
