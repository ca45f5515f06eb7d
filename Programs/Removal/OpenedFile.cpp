// SPDX-License-Identifier: MIT
#include <Removal/OpenedFile.h>

#include <algorithm>

namespace Orvane {

FileResult<std::unique_ptr<OpenFolder>> openFolderOf(const std::string& path,
                                                     FileSystem& fileSystem) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return std::make_error_code(std::errc::no_such_file_or_directory);
  return fileSystem.openFolder(nullptr, path.substr(0, std::max<std::size_t>(slash, 1)));
}

FileResult<std::unique_ptr<OpenFile>> openFile(const std::string& path, FileSystem& fileSystem) {
  auto folder = openFolderOf(path, fileSystem);
  if (!folder) return folder.error();
  return (*folder)->open(path.c_str() + path.rfind('/') + 1, ReadingPlan::everything);
}

}  // namespace Orvane
