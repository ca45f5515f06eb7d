// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include <Removal/Report.h>

namespace Orvane {

class Console;
struct ScanControl;

/// The report that a command acts on: what the file holds, for "-" what comes on standard input,
/// and for folders what a scan of them finds now. None after a complaint, or once `control` asks to
/// stop.
[[nodiscard]] std::optional<Report> reportFrom(const std::vector<std::string>& operands,
                                               Console& console, ScanControl& control);

}  // namespace Orvane
