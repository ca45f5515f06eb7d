// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <orvane/Command.h>
#include <orvane/CommandTable.h>

namespace Orvane {

// The texts have lines of 80 columns at most, and no characters but ASCII's.

/// A few lines for who typed the program's name alone.
[[nodiscard]] std::string usageText();

/// What there is to ask for.
[[nodiscard]] std::string helpText(const CommandTable& table);
/// The same of a command, or of those whose names begin with a word; empty when there is none.
[[nodiscard]] std::string helpText(const CommandTable& table, const std::string& name);

/// "orvane scan [OPTION...] FOLDER...".
[[nodiscard]] std::string synopsis(const Command& command);
/// "-q, --qos QUALITY".
[[nodiscard]] std::string formsOf(const Option& option);
/// The description with the words to choose from and the default.
[[nodiscard]] std::string descriptionOf(const Option& option);
[[nodiscard]] std::string descriptionOf(const Operands& operands);

}  // namespace Orvane
