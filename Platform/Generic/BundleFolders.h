// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <optional>
#include <string_view>

#include <Platform/Api.h>

namespace Varnel::Platform {

/// The folder of the Info.plist that belongs to an executable or library: the one it lies in, or
/// else `share/NAME` of the nearest folder above it (its installation prefix, or the build folder).
/// Absent when there is no such file. Any thread; reads folders.
[[nodiscard]] VARNEL_API std::optional<std::filesystem::path> findBundleFolder(
    const std::filesystem::path& image, std::string_view name);

}  // namespace Varnel::Platform
