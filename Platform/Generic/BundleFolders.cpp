// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/BundleFolders.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

bool holdsInfoDictionary(const fs::path& folder) {
  std::error_code ignored;
  return fs::is_regular_file(folder / "Info.plist", ignored);
}

}  // namespace

std::optional<fs::path> findSharedFolder(const fs::path& image, const fs::path& path) {
  if (!image.is_absolute()) return std::nullopt;
  for (fs::path folder = image.parent_path(); folder.has_relative_path();
       folder = folder.parent_path()) {
    fs::path shared = folder / path;
    if (holdsInfoDictionary(shared)) return shared;
  }
  return std::nullopt;
}

std::optional<fs::path> findBundleFolder(const fs::path& image, std::string_view name) {
  if (!image.is_absolute()) return std::nullopt;
  fs::path folder = image.parent_path();
  if (holdsInfoDictionary(folder)) return folder;
  return findSharedFolder(image, fs::path("share") / name);
}

}  // namespace Varnel::Platform
