// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <map>
#include <mutex>
#include <set>
#include <string>
#include <system_error>
#include <vector>

#include <Scan/FileSystem.h>
#include <Scan/FileTree.h>
#include <Scan/Loss.h>

namespace Orvane {

/// The single files of a request, each until its folder is walked. Any thread.
class NamedFiles final {
 public:
  using ByFolder = std::map<std::string, std::vector<std::string>>;

  /// The files outlive the object.
  explicit NamedFiles(const ByFolder& files) : files_(files) {}

  /// The folders whose files nobody took yet.
  [[nodiscard]] std::vector<const std::string*> folders() {
    const std::lock_guard lock(mutex_);
    std::vector<const std::string*> paths;
    for (const auto& [path, names] : files_)
      if (!taken_.contains(&path)) paths.push_back(&path);
    return paths;
  }

  /// The names of those in the folder, each once and in their order, for the first that asks.
  [[nodiscard]] std::vector<std::string> takeThoseIn(const Folder& folder) {
    if (files_.empty()) return {};
    const auto found = files_.find(pathOf(folder));
    if (found == files_.end()) return {};
    {
      const std::lock_guard lock(mutex_);
      if (!taken_.insert(&found->first).second) return {};
    }
    std::vector<std::string> names = found->second;
    std::sort(names.begin(), names.end());
    names.erase(std::unique(names.begin(), names.end()), names.end());
    return names;
  }

  /// Why something that was given for a file is none.
  [[nodiscard]] static Loss lossOf(const FolderEntry& entry) {
    if (entry.kind == FolderEntry::Kind::failure) return Loss::because(entry.error);
    const bool isFolder = entry.kind == FolderEntry::Kind::folder;
    return {Loss::Kind::unreadable,
            std::make_error_code(isFolder ? std::errc::is_a_directory : std::errc::not_supported)};
  }

 private:
  const ByFolder& files_;
  std::mutex mutex_;                    ///< Owns what follows.
  std::set<const std::string*> taken_;  ///< Folders.
};

}  // namespace Orvane
