// SPDX-License-Identifier: MIT
#pragma once

#include <stop_token>
#include <string>
#include <thread>

namespace Orvane {

class Console;
struct ScanControl;

/// While it lives, shows on the console's status line how far a scan is, ten times a second.
class ProgressLine final {
 public:
  /// Both outlive the object.
  ProgressLine(Console& console, const ScanControl& control);
  ~ProgressLine();
  ProgressLine(const ProgressLine&) = delete;
  ProgressLine& operator=(const ProgressLine&) = delete;

  /// The line for what the control says now.
  [[nodiscard]] static std::string text(const ScanControl& control);

 private:
  void show(const std::stop_token& stop);

  Console& console_;
  const ScanControl& control_;
  std::stop_source stop_;
  std::thread thread_;
};

}  // namespace Orvane
