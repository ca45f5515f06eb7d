// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <string>
#include <vector>

#include <Removal/Report.h>

namespace Orvane {

class Console;

/// What a command does with a report, until it is asked to stop. Returns the exit status.
using ReportAct = std::function<int(const Report&, const std::atomic<bool>& shouldStop)>;

/// Acts on the report that the operands name: a file that holds it, "-" for one on standard input,
/// or folders, which are scanned now. Signals ask to stop once operands are found. Returns the exit
/// status, that of the signal if one came, or 1 after a complaint.
[[nodiscard]] int actOnReport(const std::vector<std::string>& operands, Console& console,
                              const ReportAct& act);

}  // namespace Orvane
