// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <orvane/Command.h>

namespace Orvane {

// The commands of the table, each with an object of its own to write into, in the order of help.

/// Those that find duplicates.
[[nodiscard]] std::vector<Command> duplicateCommands();
/// Those that remove them, give them back, or let them share their place.
[[nodiscard]] std::vector<Command> removalCommands();
/// Those that tell what the program has kept, and erase it.
[[nodiscard]] std::vector<Command> dataCommands();
/// Those that explain the program.
[[nodiscard]] std::vector<Command> selfCommands();
/// Those that show the framework's services.
[[nodiscard]] std::vector<Command> serviceCommands();
[[nodiscard]] std::vector<Command> reminderCommands();

}  // namespace Orvane
