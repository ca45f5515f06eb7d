// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

// Each runs and returns the program's exit status.

/// `orvane data show`: tells what the product keeps for this user, and where.
struct DataShowCommand {
  bool isJSON = false;

  [[nodiscard]] int run(Console& console) const;
};

/// `orvane data export`: writes all of it as one JSON object.
struct DataExportCommand {
  [[nodiscard]] int run(Console& console) const;
};

/// `orvane data erase`: removes it.
struct DataEraseCommand {
  bool erases = false;  ///< Or else it only tells what would go.

  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
