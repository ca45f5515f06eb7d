// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Values/QualityOfService.h>
#include <orvane/ScanChoice.h>

namespace Orvane {

class Console;

/// `orvane scan`: finds the duplicate files in folders.
struct ScanCommand : ScanChoice {
  Varnel::Platform::QualityOfService qos = Varnel::Platform::QualityOfService::utility;
  bool isJSON = false;
  bool showsProgress = true;  ///< While standard error is a terminal.
  bool playsSound = false;
  std::optional<std::string> analyticsEndpoint;  ///< Where events go; nowhere without one.
  bool printsEvents = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

}  // namespace Orvane
