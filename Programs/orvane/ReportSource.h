// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include <Removal/Report.h>
#include <Scan/ScanRequest.h>

namespace Orvane {

class Console;
struct ScanControl;

/// What a command acts on: the report that it was given, or the folders that it is to scan now.
using ReportSource = std::variant<Report, ScanRequest>;

/// The source that operands name: a file that holds a report, "-" for one on standard input, or
/// folders. None after a complaint. Looks up and reads, which may take for ever.
[[nodiscard]] std::optional<ReportSource> findSource(const std::vector<std::string>& operands,
                                                     Console& console);

/// Its report. None after a complaint, or once `control` asks to stop.
[[nodiscard]] std::optional<Report> reportFrom(ReportSource source, Console& console,
                                               ScanControl& control);

}  // namespace Orvane
