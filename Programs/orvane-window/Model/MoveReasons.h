// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <system_error>

#include <Removal/Removal.h>
#include <Removal/Restoration.h>

namespace Orvane {

// What a removal or a restoration met, in the user's language. Any thread.

[[nodiscard]] std::string textOf(RemovalStep::Outcome outcome, std::error_code code);
[[nodiscard]] std::string textOf(RestorationStep::Outcome outcome, std::error_code code);
[[nodiscard]] std::string textOf(const Removal::Problem& problem);
[[nodiscard]] std::string textOf(const Restoration::Problem& problem);

}  // namespace Orvane
