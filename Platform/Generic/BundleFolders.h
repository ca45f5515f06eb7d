// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <optional>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

// Where an executable or library has its Info.plist; absent when there is none. Any thread; reads
// folders.

/// The folder of this path, as in "share/varnel-0.1", below the nearest folder above the image that
/// has one: its installation prefix, or the build folder.
[[nodiscard]] VARNEL_API std::optional<std::filesystem::path> findSharedFolder(
    const std::filesystem::path& image, const std::filesystem::path& path);

/// The folder that the image lies in or, when that has no Info.plist, the shared folder
/// "share/NAME".
[[nodiscard]] VARNEL_API std::optional<std::filesystem::path> findBundleFolder(
    const std::filesystem::path& image, std::string_view name);

}  // namespace Varnel::Platform
