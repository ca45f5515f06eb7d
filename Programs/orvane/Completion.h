// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <orvane/CommandTable.h>

namespace Orvane {

enum class Shell { bash, zsh, fish };

/// The script by which a shell completes the program's arguments.
[[nodiscard]] std::string completionScript(const CommandTable& table, Shell shell);

}  // namespace Orvane
