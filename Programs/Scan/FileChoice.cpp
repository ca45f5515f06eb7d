// SPDX-License-Identifier: MIT
#include <Scan/FileChoice.h>

#include <algorithm>
#include <string>

#include <Scan/FileTree.h>
#include <Scan/ScanRequest.h>

namespace Orvane {
namespace {

std::string_view lastName(std::string_view way) {
  return way.substr(way.rfind('/') + 1);
}

}  // namespace

FileChoice::FileChoice(const ScanRequest& request)
    : request_(request),
      include_(request.include.begin(), request.include.end()),
      exclude_(request.exclude.begin(), request.exclude.end()) {}

bool FileChoice::hasChosenSize(std::uint64_t size) const {
  return size >= request_.minSize && size <= request_.maxSize;
}

bool FileChoice::takes(const Folder& folder, std::string_view name) const {
  return !leavesOut(Glob::Kind::file, folder, name) &&
         (include_.empty() || isAmong(include_, Glob::Kind::file, folder, name));
}

bool FileChoice::enters(const Folder& folder, std::string_view way) const {
  for (std::size_t end = way.find('/'); end != std::string_view::npos; end = way.find('/', end + 1))
    if (leavesOut(Glob::Kind::folder, folder, way.substr(0, end))) return false;
  return !leavesOut(Glob::Kind::folder, folder, way);
}

bool FileChoice::leavesOut(Glob::Kind kind, const Folder& folder, std::string_view way) const {
  return (request_.skipsHidden && lastName(way).starts_with('.')) ||
         isAmong(exclude_, kind, folder, way);
}

bool FileChoice::isAmong(const Globs& globs, Glob::Kind kind, const Folder& folder,
                         std::string_view way) {
  return std::any_of(globs.begin(), globs.end(), [&](const Glob& glob) {
    return glob.isForPaths() ? glob.matchesPath(pathBelow(folder, way), kind)
                             : glob.matchesName(std::string(lastName(way)));
  });
}

}  // namespace Orvane
