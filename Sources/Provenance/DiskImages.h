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

/// What the system's disk-image tool tells of the images that are mounted: its answer to "info
/// -plist", with whichever status it ends. Absent when the tool is missing or prints no property
/// list. Blocks the caller while the tool runs; with a `timeout` the tool is ended after it, and
/// has told nothing.
[[nodiscard]] std::optional<Platform::PropertyValue> mountedDrivesInfo(
    Platform::ProcessLauncher& launcher, const std::string& toolPath,
    std::optional<Platform::TimeInterval> timeout);

/// The file of the first image with an entity that is mounted at exactly `volumePath`. What is
/// missing or of the wrong type in `volumesInfo` counts as empty.
[[nodiscard]] std::optional<std::string> findImagePath(const std::string& volumePath,
                                                       const Platform::PropertyValue& volumesInfo);

}  // namespace Varnel
