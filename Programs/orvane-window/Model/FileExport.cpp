// SPDX-License-Identifier: MIT
#include <orvane-window/Model/FileExport.h>

#include <cerrno>
#include <filesystem>
#include <fstream>

#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <orvane-window/Model/DuplicateList.h>

namespace Orvane {
namespace {

std::string lineOf(const std::string& path) {
  const bool isLine = Varnel::Platform::isValidUTF8(path) && path.find('\n') == std::string::npos;
  return (isLine ? path : Varnel::Platform::URL::fileURLWithPath(path).absoluteString()) + "\n";
}

}  // namespace

std::error_code writeFile(const std::string& path, const TextSource& source) {
  const std::string unfinished = path + ".part";
  errno = 0;
  std::ofstream file(unfinished, std::ios::binary | std::ios::trunc);
  const bool isWritten =
      file && source([&](std::string_view text) {
        return static_cast<bool>(
            file.write(text.data(), static_cast<std::streamsize>(text.size())).flush());
      });
  // Streams tell no reason of their own.
  std::error_code error(isWritten ? 0 : errno ? errno : EIO, std::generic_category());
  const bool wasMade = file.is_open();
  file.close();
  if (!error) std::filesystem::rename(unfinished, path, error);
  std::error_code ignored;
  if (error && wasMade) std::filesystem::remove(unfinished, ignored);
  return error;
}

bool writeChosenFiles(const DuplicateList& list, const TextWriter& write) {
  TextParts parts(write);
  const auto& groups = list.report()->groups;
  for (std::size_t i = 0; i < groups.size(); ++i)
    for (std::size_t k = 0; k < groups[i].files.size(); ++k)
      if (list.isChosen({i, k}) && !parts.add(lineOf(groups[i].files[k].path))) return false;
  return parts.flush();
}

}  // namespace Orvane
