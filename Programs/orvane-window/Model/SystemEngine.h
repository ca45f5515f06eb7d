// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <orvane-window/Model/Engine.h>

namespace Orvane {

class Console;
class ScanAnalytics;

/// The scan and the removal of the command line, on this machine. What a scan leaves out is named
/// in the log.
class SystemEngine final : public Engine {
 public:
  /// Events go to the endpoint, if the user has agreed. The console outlives the engine.
  SystemEngine(Console& console, std::optional<std::string> analyticsEndpoint);
  ~SystemEngine() override;

  ScanOutcome scan(ScanRequest request, ScanControl& control) override;
  bool isPassing(const std::string& path) const override;
  std::shared_ptr<PlannedRemoval> plan(std::shared_ptr<const Report> report, Selection selection,
                                       std::shared_ptr<MoveProgress> progress) override;
  MoveOutcome restore(MoveProgress& progress) override;

 private:
  Console& console_;
  const std::optional<std::string> analyticsEndpoint_;
  std::unique_ptr<ScanAnalytics> analytics_;  ///< Of the last scan: its events have time to go.
};

}  // namespace Orvane
