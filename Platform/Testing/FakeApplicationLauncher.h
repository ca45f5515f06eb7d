// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
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
///     launcher.installed.insert("com.quennel.Orvane2");
///     …
///     EXPECT_EQ(launcher.launches.at(0).action, "scan");
class FakeApplicationLauncher final : public ApplicationLauncher {
 public:
  /// A launch that goes wrong finds no application.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::set<std::string> installed;          ///< Desktop entries.
  std::vector<ApplicationLaunch> launches;  ///< Those that succeeded.

  void launch(const ApplicationLaunch& launch,
              std::function<void(const std::optional<PlatformError>&)> answer) override {
    if (faults->strikes() || !installed.contains(launch.desktopEntry))
      return answer(PlatformError(std::make_error_code(std::errc::no_such_file_or_directory)));
    launches.push_back(launch);
    answer(std::nullopt);
  }
};

}  // namespace Varnel::Platform::Testing
