// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Ports/Workspace.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A machine with the applications that the test installs. Set them before other threads read.
///
///     FakeWorkspace workspace;
///     workspace.applications.emplace("com.quennel.Orvane2", URL::fileURLWithPath("/opt/app/"));
class FakeWorkspace final : public Workspace {
 public:
  /// Questions. One that goes wrong finds nothing.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::map<std::string, URL> applications;  ///< Location by bundle identifier.

  [[nodiscard]] std::optional<URL> applicationURL(const std::string& bundleIdentifier) override {
    if (faults->strikes()) return std::nullopt;
    const auto found = applications.find(bundleIdentifier);
    if (found == applications.end() || bundleIdentifier.empty()) return std::nullopt;
    return found->second;
  }
};

}  // namespace Varnel::Platform::Testing
