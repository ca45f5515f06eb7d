// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The version of the operating system.
struct OperatingSystemVersion final {
  long major = 0;
  long minor = 0;
  long patch = 0;

  bool operator==(const OperatingSystemVersion&) const = default;
};

/// Facts of the running process that do not change while it runs. Any thread.
class VARNEL_API ProcessInfo {
 public:
  virtual ~ProcessInfo() = default;
  ProcessInfo& operator=(const ProcessInfo&) = delete;

  /// The value of an environment variable; absent when it is not set, empty when set to nothing. A
  /// text that can be no name of one ("", "A=B") is not set.
  [[nodiscard]] virtual std::optional<std::string> environmentVariable(
      std::string_view name) const = 0;

  /// The system's version; where it is numbered otherwise, its core's. Numbers that are not known
  /// are 0.
  [[nodiscard]] virtual OperatingSystemVersion operatingSystemVersion() const = 0;

  /// The absolute path of the running executable, which may have been removed or replaced since;
  /// empty when the system does not tell.
  [[nodiscard]] virtual std::string executablePath() const = 0;

  /// The folder that holds the running application's Info.plist; absent when it has none.
  [[nodiscard]] virtual std::optional<std::string> mainBundleFolder() const = 0;

  /// The folder with the Info.plist of the library or executable that contains `address`; absent
  /// when there is none. `sharedFolder` is its path below an installation's prefix, as in
  /// "share/varnel-0.1", which counts before an Info.plist beside the image; when empty, the
  /// image's own name below "share" serves, after that Info.plist.
  [[nodiscard]] virtual std::optional<std::string> bundleFolderOfCode(
      const void* address, std::string_view sharedFolder) const = 0;
};

}  // namespace Varnel::Platform
