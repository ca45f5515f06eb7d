// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstddef>
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

  /// What the control says some time after the reading began: the phase, the bytes, the time that
  /// those known of will take, the rate, and the files. What has no room in the columns is left out
  /// from the end.
  [[nodiscard]] static std::string text(const ScanControl& control,
                                        std::chrono::milliseconds readingTime, std::size_t columns);

 private:
  void show(const std::stop_token& stop);

  Console& console_;
  const ScanControl& control_;
  std::stop_source stop_;
  std::thread thread_;
};

}  // namespace Orvane
