// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

namespace Varnel::Platform::Linux {

/// The program that the command line of a desktop entry starts: a name to be searched on PATH, or a
/// path.
///
///     programOf(R"("/opt/My App/app" --new %U)");      // "/opt/My App/app"
///     programOf("env LANG=C app --zoom=100%%");        // "app"
///
/// `commandLine` is the value of the key "Exec" once the escapes of texts are undone. Quotes and
/// the escapes inside them are undone here, and then field codes are removed, since there is no
/// file to put in their place. For "env", the program is the one that it runs. Absent when the line
/// is malformed, has a field code that does not exist, or starts nothing.
[[nodiscard]] std::optional<std::string> programOf(const std::string& commandLine);

}  // namespace Varnel::Platform::Linux
