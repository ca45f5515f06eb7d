// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string_view>
#include <system_error>

namespace Orvane {

/// Keeps files that are opened later from taking the place of a standard stream that the program
/// was started without; such a stream fails when it is used. To be called first of all.
void reserveStandardStreams();

/// Makes a write to a closed pipe fail with an error rather than end the program at once.
void failOnClosedPipes();

/// Whether a closed pipe ends programs: not where the program was started to ignore that.
[[nodiscard]] bool closedPipesEnd();

/// Ends the program as a write to a closed pipe does by itself. Returns the exit status for that
/// where the signal is blocked.
[[nodiscard]] int endByClosedPipe();

/// Writes all of the text to the standard output, or says what went wrong.
[[nodiscard]] std::error_code writeStandardOutput(std::string_view text);

/// Writes the text to standard error; a failure there cannot be reported.
void writeStandardError(std::string_view text);
/// The same for signal handlers.
void writeStandardErrorInHandler(std::string_view text);

/// Whether it is a terminal on which lines can be written over.
[[nodiscard]] bool isStandardErrorATerminal();
[[nodiscard]] bool isStandardOutputATerminal();
/// How wide that terminal is now; 80 where it does not tell.
[[nodiscard]] std::size_t standardErrorColumns();
[[nodiscard]] std::size_t standardOutputColumns();
/// Whether the user wants no colours, nor other means of emphasis: NO_COLOR says so.
[[nodiscard]] bool refusesColours();

}  // namespace Orvane
