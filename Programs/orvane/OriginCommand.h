// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace Orvane {

class Console;

/// `orvane origin`: tells which download this program came from, or what a file's own attribute
/// says of the file's download.
struct OriginCommand {
  std::string file;  ///< The program itself when empty.
  bool isJSON = false;

  /// Runs the command and returns the program's exit status: 1 when the file is not there.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
