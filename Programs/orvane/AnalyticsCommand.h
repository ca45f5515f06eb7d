// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include <Varnel/Tallyhouse/AnalyticsContext.h>

namespace Orvane {

class Console;

/// `orvane analytics`: tells whether the user agreed to be counted, or keeps the user's answer.
struct AnalyticsCommand {
  std::optional<Tallyhouse::Consent> answer;
  bool resets = false;  ///< Events are counted as those of another installation from now on.

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
