// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform {
class ProcessLauncher;
}

namespace Varnel {

/// The mounted images, as the system's disk-image tool lists them: its answer to "info -plist",
/// whatever its exit status. Absent when the tool is missing or prints no property list. Blocks the
/// caller while the tool runs. After `timeout`, if given, the tool is ended and the result is
/// absent.
[[nodiscard]] std::optional<Platform::PropertyValue> mountedDrivesInfo(
    Platform::ProcessLauncher& launcher, const std::string& toolPath,
    std::optional<Platform::TimeInterval> timeout);

/// The file of the first image with an entity that is mounted at exactly `volumePath`. A value that
/// is missing or of the wrong type in `volumesInfo` counts as empty.
[[nodiscard]] std::optional<std::string> findImagePath(const std::string& volumePath,
                                                       const Platform::PropertyValue& volumesInfo);

}  // namespace Varnel
