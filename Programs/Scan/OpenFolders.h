// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <vector>

#include <Scan/FileSystem.h>

namespace Orvane {

struct Folder;

/// The folders that one task has opened last. The next one is opened by the way from the nearest of
/// them, so that neither the files of a folder nor the folders of a deep tree cost a look-up of
/// the whole path each. One thread at a time.
class OpenFolders final {
 public:
  explicit OpenFolders(FileSystem& fileSystem) : fileSystem_(fileSystem) {}

  /// The folder, opened if it is not open yet. It stays open until the next call at least.
  [[nodiscard]] FileResult<OpenFolder*> open(const Folder& folder);

  /// Closes all but the last one opened, and keeps no more from now on: the host leaves us few
  /// descriptors.
  void doWithFew();

 private:
  struct Entry {
    const Folder* folder;
    std::unique_ptr<OpenFolder> open;
  };

  [[nodiscard]] Entry* find(const Folder* folder);

  FileSystem& fileSystem_;
  std::size_t maxCount_ = 16;
  std::vector<Entry> entries_;  ///< The one used last is the last.
};

}  // namespace Orvane
