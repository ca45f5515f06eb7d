// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace Varnel::Platform::POSIX {

/// The files of one application of this user, by its base identifier, in the folders of the
/// desktop's base-directory standard. They need not exist.
///
/// The environment may move the folders, but only to absolute paths. Whatever an identifier holds,
/// it names one folder and no path.
[[nodiscard]] std::filesystem::path settingsFolder(const std::string& identifier);
[[nodiscard]] std::filesystem::path notificationStore(const std::string& identifier);
/// Those of all applications that are there.
[[nodiscard]] std::vector<std::filesystem::path> notificationStores();
/// The folder of the applications' folders that have such a file, and the file in one of them.
[[nodiscard]] std::filesystem::path stateFolders();
[[nodiscard]] std::filesystem::path notificationStoreIn(const std::filesystem::path& folder);
[[nodiscard]] std::filesystem::path analyticsSpool(const std::string& identifier);

/// Where other programs keep the cookies that are read here.
[[nodiscard]] std::filesystem::path userDataFolder();

}  // namespace Varnel::Platform::POSIX
