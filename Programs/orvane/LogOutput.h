// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// Where the log goes beside its file.
enum class LogOutput {
  none,  ///< Nowhere, but for the events that a scan is asked to print: standard error shows them.
  standardError,
  standardOutput,
};

/// Installs that for the process. To be called before anything of the framework is used; the
/// console lives as long as the process.
void sendLog(LogOutput output, Console& console);

}  // namespace Orvane
