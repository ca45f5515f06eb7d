// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

namespace Tallyhouse {

/// Events by where they are.
struct SpoolCounts final {
  std::int64_t waiting = 0;  ///< In the file, of all processes, to be delivered.
  std::int64_t held = 0;     ///< Of this process, in memory alone, where a kill takes them.
  std::int64_t dropped = 0;  ///< Too many, too large or given up, since the file was begun.
};

}  // namespace Tallyhouse
