// SPDX-License-Identifier: MIT
#include <Scan/ScanResult.h>

#include <algorithm>

#include <Scan/FolderGroups.h>

namespace Orvane {
std::vector<std::string> ScanResult::pathsOf(const DuplicateGroup& group) const {
  std::vector<std::string> paths;
  for (std::uint32_t i = 0; i < group.count; ++i)
    paths.push_back(tree->pathOf(files[group.begin + i]));
  return paths;
}

std::vector<DuplicateFile> ScanResult::filesOf(const DuplicateGroup& group) const {
  std::vector<DuplicateFile> found;
  for (std::uint32_t i = 0; i < group.count; ++i) found.push_back(fileAt(group.begin + i));
  return found;
}

DuplicateFile ScanResult::fileAt(std::uint32_t index) const {
  const FileNumber number = files[index];
  DuplicateFile file{.path = tree->pathOf(number),
                     .identity = tree->identityOf(number),
                     .modifiedAt = modifiedAt[index],
                     .isReference = isReference(number)};
  for (const FileLink& link : linksOf(number)) file.names.push_back(tree->pathOf(link.name));
  // Those that are to stay come first among the links.
  std::sort(file.names.begin(), file.names.end());
  return file;
}

std::vector<std::string> ScanResult::pathsOf(const FolderGroup& group) const {
  std::vector<std::string> paths;
  for (std::uint32_t i = 0; i < group.count; ++i)
    paths.push_back(pathOf(tree->folders()[folders[group.begin + i]]));
  return paths;
}

std::span<const FileLink> ScanResult::linksOf(FileNumber file) const {
  const auto begin =
      std::lower_bound(links.begin(), links.end(), file,
                       [](const FileLink& link, FileNumber number) { return link.file < number; });
  const auto end =
      std::find_if(begin, links.end(), [&](const FileLink& link) { return link.file != file; });
  return {begin, end};
}

// A name in a reference folder goes before the others, and is the one that the file is known by.
bool ScanResult::isReference(FileNumber file) const {
  return tree->folderOf(file).isReference;
}

bool ScanResult::isImplied(const DuplicateGroup& group) const {
  if (folderClasses[tree->folderOf(files[group.begin]).number] == 0) return false;
  std::vector<std::uint32_t> around;
  for (std::uint32_t i = 0; i < group.count; ++i)
    around.push_back(tree->folderOf(files[group.begin + i]).number);
  return areOfOneClass(std::move(around), folderClasses);
}

}  // namespace Orvane
