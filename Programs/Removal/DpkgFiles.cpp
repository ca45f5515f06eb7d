// SPDX-License-Identifier: MIT
#include <Removal/DpkgFiles.h>

#include <cerrno>
#include <fstream>
#include <map>
#include <string>
#include <utility>

namespace Orvane {
namespace {

namespace fs = std::filesystem;
using Owned = Varnel::Platform::Result<std::set<std::string_view>, std::error_code>;

std::string_view nameIn(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

/// Paths by their names: a list may lead to a file by a link of a folder, as those of /bin do, and
/// only where the names agree is it worth the system's time to follow it.
class Sought final {
 public:
  explicit Sought(const std::set<std::string_view>& paths) {
    for (const std::string_view path : paths) byName_.emplace(nameIn(path), path);
  }

  void meet(const std::string& listed) {
    auto [path, end] = byName_.equal_range(nameIn(listed));
    if (path == end || !listed.starts_with('/')) return;
    std::error_code missing;
    const fs::path folder = fs::canonical(fs::path(listed).parent_path(), missing);
    const std::string resolved = missing ? listed : (folder / nameIn(listed)).string();
    for (; path != end; ++path)
      if (path->second == resolved) owned_.insert(path->second);
  }

  [[nodiscard]] std::set<std::string_view> takeOwned() { return std::move(owned_); }

 private:
  std::multimap<std::string_view, std::string_view> byName_;
  std::set<std::string_view> owned_;
};

[[nodiscard]] std::error_code read(const fs::path& list, Sought& sought) {
  errno = 0;
  std::ifstream lines(list);
  for (std::string line; std::getline(lines, line);) sought.meet(line);
  if (lines.eof()) return {};
  return {errno != 0 ? errno : EIO, std::generic_category()};
}

}  // namespace

DpkgFiles::DpkgFiles(fs::path folder) : folder_(std::move(folder)) {}

Owned DpkgFiles::among(const std::set<std::string_view>& paths) {
  Sought sought(paths);
  std::error_code error;
  const fs::directory_iterator lists(folder_ / "info", error);
  if (error == std::errc::no_such_file_or_directory) return std::set<std::string_view>();
  if (error) return error;
  for (const fs::directory_entry& list : lists) {
    if (list.path().extension() != ".list") continue;
    if ((error = read(list.path(), sought))) return error;
  }
  // Files that one package has put out of the way of another.
  const fs::path diversions = folder_ / "diversions";
  if (fs::exists(diversions, error) && (error = read(diversions, sought))) return error;
  return sought.takeOwned();
}

}  // namespace Orvane
