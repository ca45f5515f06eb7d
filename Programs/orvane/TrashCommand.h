// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <string>
#include <vector>

#include <Removal/Selection.h>

namespace Orvane {

class Console;
struct Report;

/// `orvane trash`: moves the duplicates of a report to the trash, but for one of each group.
struct TrashCommand {
  std::vector<std::string> operands;  ///< A report, or folders.
  KeepRule keep = KeepRule::oldest;
  bool moves = false;  ///< Or else it shows what would be moved.
  bool isJSON = false;
  bool allowsHiddenFolders = false;
  bool allowsOtherFileSystems = false;
  bool allowsPackagedFiles = false;
  bool allowsHardLinks = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;

 private:
  [[nodiscard]] int moveOrShow(const Report& report, const std::atomic<bool>& shouldStop,
                               Console& console) const;
};

/// The exit status of commands that left files alone because of what they met.
inline constexpr int someNotMoved = 3;

}  // namespace Orvane
