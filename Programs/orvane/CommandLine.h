// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <variant>

#include <orvane/LogOutput.h>

namespace Orvane {

class Console;

/// What the arguments ask for.
struct Invocation {
  std::function<int(Console&)> command;  ///< Runs it and returns the exit status.
  LogOutput logOutput = LogOutput::none;
};

/// The answer to --help or --version.
struct Information {
  std::string text;
};

/// What is wrong with the arguments, in one line; empty when there are none.
struct UsageError {
  std::string message;
};

/// Parses the program's arguments, and runs nothing.
[[nodiscard]] std::variant<Invocation, Information, UsageError> parseCommandLine(
    int count, const char* const* arguments);

}  // namespace Orvane
