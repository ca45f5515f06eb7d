// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace Varnel::Platform::Linux {

/// What udev's rules recorded about a block device when it was plugged in. Absent when udev does
/// not run or does not know. Any thread.
[[nodiscard]] std::optional<std::string> udevProperty(const std::string& deviceName,
                                                      const char* property);

/// The file system UUIDs by device name, as udev's links list them.
[[nodiscard]] std::map<std::string, std::string> fileSystemUUIDs(
    const char* folder = "/dev/disk/by-uuid");

/// A text in which udev wrote unsafe bytes as "\x20".
[[nodiscard]] std::string udevDecoded(std::string_view text);

}  // namespace Varnel::Platform::Linux
