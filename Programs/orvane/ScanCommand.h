// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Values/QualityOfService.h>
#include <orvane/ResultText.h>
#include <orvane/ScanChoice.h>

namespace Orvane {

class Console;
class Interruption;
struct ScanFacts;

/// `orvane scan`: finds the duplicate files in folders.
struct ScanCommand : ScanChoice {
  enum class Form { text, json, pathList };

  Varnel::Platform::QualityOfService qos = Varnel::Platform::QualityOfService::utility;
  Form form = Form::text;
  std::size_t maxGroups = TextForm::allGroups;  ///< Those that waste most.
  bool showsProgress = true;                    ///< While standard error is a terminal.
  bool playsSound = false;
  std::optional<std::string> analyticsEndpoint;  ///< Where events go; nowhere without one.
  bool printsEvents = false;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;

 private:
  [[nodiscard]] bool write(const ScanResult& result, const ScanFacts& facts,
                           const Interruption& interruption, Console& console) const;
};

}  // namespace Orvane
