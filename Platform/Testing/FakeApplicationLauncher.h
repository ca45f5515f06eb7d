// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Ports/ApplicationLauncher.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A desktop with the applications that the test installs. One thread.
///
///     FakeApplicationLauncher launcher;
///     launcher.installed["com.quennel.Orvane2"] = {"scan"};
///     …
///     EXPECT_EQ(launcher.launches.at(0).action, "scan");
class FakeApplicationLauncher final : public ApplicationLauncher {
 public:
  /// A launch that goes wrong finds no application.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::map<std::string, std::set<std::string>> installed;  ///< Desktop entries and their actions.
  std::vector<ApplicationLaunch> launches;  ///< Those that succeeded, without unlisted actions.

  void launch(const ApplicationLaunch& launch,
              std::function<void(const std::optional<PlatformError>&)> answer) override {
    const auto application = installed.find(launch.desktopEntry);
    if (faults->strikes() || application == installed.end())
      return answer(PlatformError(std::make_error_code(std::errc::no_such_file_or_directory)));
    launches.push_back(launch);
    if (!application->second.contains(launch.action)) launches.back().action.clear();
    answer(std::nullopt);
  }
};

}  // namespace Varnel::Platform::Testing
