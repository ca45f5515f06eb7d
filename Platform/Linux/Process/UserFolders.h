// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <string>

namespace Varnel::Platform::Linux {

/// The folders of the desktop's base-directory convention. The environment may move them, but only
/// to absolute paths. They need not exist.
[[nodiscard]] std::filesystem::path userDataFolder();
[[nodiscard]] std::filesystem::path userConfigurationFolder();
[[nodiscard]] std::filesystem::path userStateFolder();

/// The name of this application's own folder in them: that of its executable.
[[nodiscard]] std::string applicationFolderName();

}  // namespace Varnel::Platform::Linux
