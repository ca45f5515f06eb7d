// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

namespace Orvane {

class Console;

// Who sends events: a random identifier, which tells nothing of the machine or its user. It is kept
// in the product's settings from the first events with the user's consent on, until that is taken
// back or another identifier is asked for.

/// Absent until there is one, and where the settings cannot be read.
[[nodiscard]] std::optional<std::string> storedClientIdentifier();

/// The stored one, or else a new one that is kept from now on, if it can be. Only with the user's
/// consent.
[[nodiscard]] std::string keptClientIdentifier();

/// Returns whether there is none any more, and complains where there is.
[[nodiscard]] bool forgetClientIdentifier(Console& console);

}  // namespace Orvane
