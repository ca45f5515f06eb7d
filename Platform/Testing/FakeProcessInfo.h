// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>

namespace Varnel::Platform::Testing {

/// A process whose facts the test sets. Set them before other threads read.
///
///     FakeProcessInfo process;
///     process.environment["APP_SANDBOX_CONTAINER_ID"] = "";
class FakeProcessInfo final : public ProcessInfo {
 public:
  std::map<std::string, std::string, std::less<>> environment;
  OperatingSystemVersion systemVersion = {6, 1, 0};
  std::string executable = "/usr/bin/host";
  std::optional<std::string> mainBundle;  ///< The folder with the application's Info.plist.
  std::optional<std::string> codeBundle;  ///< The same of any code, whatever address is asked.
  /// Whether code without a `codeBundle` has its own, as the system finds it: above all the
  /// framework, whose texts lie there.
  bool keepsBundles = true;

  [[nodiscard]] std::optional<std::string> environmentVariable(
      std::string_view name) const override {
    const auto found = environment.find(name);
    if (found == environment.end()) return std::nullopt;
    return found->second;
  }
  [[nodiscard]] OperatingSystemVersion operatingSystemVersion() const override {
    return systemVersion;
  }
  [[nodiscard]] std::string executablePath() const override { return executable; }
  [[nodiscard]] std::optional<std::string> mainBundleFolder() const override { return mainBundle; }
  [[nodiscard]] std::optional<std::string> bundleFolderOfCode(
      const void* address, std::string_view sharedFolder) const override {
    if (codeBundle || !keepsBundles) return codeBundle;
    return systemPorts().processInfo.get().bundleFolderOfCode(address, sharedFolder);
  }
};

}  // namespace Varnel::Platform::Testing
