// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace Varnel::Platform::Linux {

/// The files of one application of this user, by its base identifier, in the folders of the
/// desktop's base-directory standard. They need not exist.
///
/// The environment may move the folders, but only to absolute paths. Whatever an identifier holds,
/// it names one folder and no path.
[[nodiscard]] std::filesystem::path settingsFile(const std::string& identifier);
[[nodiscard]] std::filesystem::path notificationStore(const std::string& identifier);
/// Those of all applications that are there.
[[nodiscard]] std::vector<std::filesystem::path> notificationStores();
[[nodiscard]] std::filesystem::path analyticsSpool(const std::string& identifier);

/// Where other programs keep the cookies that are read here, and the name of this program's own
/// folder there: that of its executable.
[[nodiscard]] std::filesystem::path userDataFolder();
[[nodiscard]] std::string executableName();

}  // namespace Varnel::Platform::Linux
