// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/FileURLs.h>

#include <filesystem>

#include <Varnel/Platform/Ports/UserAccount.h>

namespace Basalt {

using Varnel::Platform::URL;

URL realHome(const Varnel::Platform::UserAccount& userAccount) {
  return URL::fileURLWithPath(userAccount.realHomeFolder() + "/");
}

bool isDirectory(const URL& url) {
  if (url.hasDirectoryPath()) return true;
  std::error_code absent;
  return std::filesystem::is_directory(url.path(), absent);
}

}  // namespace Basalt
