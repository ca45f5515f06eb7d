// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <orvane/CommandTable.h>

namespace Orvane {

/// The manual page of the program, as roff for `man`.
[[nodiscard]] std::string manualPage(const CommandTable& table);

}  // namespace Orvane
