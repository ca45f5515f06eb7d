// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include <orvane/Command.h>

namespace Orvane {

/// How arguments were taken.
struct TakenArguments {
  Complaint wrong;        ///< The first complaint, which ended it.
  Complaint missing;      ///< What the command cannot do without.
  std::size_t count = 0;  ///< Arguments that were taken.
};

/// Hands arguments to the options and operands that take them, in their order and byte for byte.
/// Options may follow operands; after "--" all are operands.
///
///     const auto taken = takeArguments(command.options, command.operands, {"--json", "a"});
///     if (taken.wrong) return UsageError{*taken.wrong};
///
/// Main thread only: the C library's parser has one state.
[[nodiscard]] TakenArguments takeArguments(const std::vector<Option>& options,
                                           const Operands& operands,
                                           std::vector<std::string> arguments);

/// The same for the options before the first operand.
[[nodiscard]] TakenArguments takeLeadingOptions(const std::vector<Option>& options,
                                                std::vector<std::string> arguments);

}  // namespace Orvane
