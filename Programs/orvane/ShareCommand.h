// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <string>
#include <vector>

namespace Orvane {

class Console;
struct Report;

/// `orvane share`: lets the duplicates of a report lie in the same place of their disk.
struct ShareCommand {
  std::vector<std::string> operands;  ///< A report, or folders.
  bool isTrial = false;               ///< It only asks what could be shared.
  bool isJSON = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;

 private:
  [[nodiscard]] int share(const Report& report, const std::atomic<bool>& shouldStop,
                          Console& console) const;
};

}  // namespace Orvane
