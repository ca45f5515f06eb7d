// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <memory>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Testing {

/// Pretends to launch programs. Each launch plays `script` as it is then. One thread at a time.
///
///     launcher.script.output = "<plist>…</plist>";
///     launcher.script.questions = 3;  // runs until it has been asked three times
class FakeProcessLauncher final : public ProcessLauncher {
 public:
  struct Script {
    std::string output = {};
    int questions = 0;  ///< How often `isRunning` answers yes; for ever when negative.
    std::error_code launchError = {};  ///< Why it cannot be launched, if so.
  };

  /// Launches. A delayed program runs until it was asked a few times more.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  Script script;
  std::vector<std::vector<std::string>> launches;  ///< Path and arguments of each launch.
  int terminations = 0;                            ///< How many were ended while they ran.

  [[nodiscard]] Result<std::unique_ptr<LaunchedProcess>, std::error_code> launch(
      const std::string& path, const std::vector<std::string>& arguments) override {
    if (isCutShort(path) || std::ranges::any_of(arguments, isCutShort))
      return std::make_error_code(std::errc::invalid_argument);
    launches.push_back({path});
    launches.back().insert(launches.back().end(), arguments.begin(), arguments.end());
    if (script.launchError) return script.launchError;
    Script played = script;
    switch (faults->next()) {
      case Fault::fails:
        return std::make_error_code(std::errc::resource_unavailable_try_again);
      case Fault::absent:
        return std::make_error_code(std::errc::no_such_file_or_directory);
      case Fault::delays:
        if (played.questions >= 0) played.questions += 3;
        break;
      case Fault::none:
        break;
    }
    return std::unique_ptr<LaunchedProcess>(std::make_unique<Process>(*this, std::move(played)));
  }

 private:
  class Process final : public LaunchedProcess {
   public:
    Process(FakeProcessLauncher& launcher, Script script)
        : launcher_(launcher), script_(std::move(script)) {}
    ~Process() override { terminate(); }

    [[nodiscard]] bool isRunning() override {
      if (script_.questions == 0) return false;
      if (script_.questions > 0) --script_.questions;
      return true;
    }
    void terminate() override {
      if (script_.questions == 0) return;
      script_.questions = 0;
      ++launcher_.terminations;
    }
    [[nodiscard]] std::string readOutput() override { return std::exchange(script_.output, {}); }

   private:
    FakeProcessLauncher& launcher_;
    Script script_;
  };
};

}  // namespace Varnel::Platform::Testing
