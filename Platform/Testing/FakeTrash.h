// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Testing {

/// A trash, and the files of a disk, in memory. Any thread, but for what the test sets.
///
///     trash.files["/home/ann/a.jpg"] = {.inode = 1, .size = 700};
///     …
///     EXPECT_EQ(trash.trashed.at(0).path, "/home/ann/a.jpg");
class FakeTrash final : public Trash {
 public:
  /// Moves and restorings. One that goes wrong fails, or finds no trash.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::map<std::string, FileState> files;  ///< What is there, by path.
  std::vector<TrashedFile> trashed;        ///< What is in the trash, in the order of its coming.
  std::set<std::string> missingFolders;
  std::string folder = "/trash";
  std::set<std::string> foldersWithoutTrash;

  [[nodiscard]] Result<FileState, TrashError> state(const std::string& path) override {
    if (!isPath(path)) return invalid();
    const std::lock_guard lock(mutex_);
    const auto found = files.find(path);
    if (found == files.end()) return TrashError{.reason = Reason::changed};
    return found->second;
  }

  [[nodiscard]] bool isInTrash(const std::string& path) override {
    return path.starts_with(folder + "/");
  }

  [[nodiscard]] Result<std::string, TrashError> folderFor(const std::string& path) override {
    if (!isPath(path)) return invalid();
    if (foldersWithoutTrash.contains(parentOf(path))) return TrashError{.reason = Reason::noTrash};
    return folder;
  }

  [[nodiscard]] Result<TrashedFile, TrashError> move(const std::string& path,
                                                     const FileState& expected,
                                                     const Ready& ready) override {
    const auto before = state(path);
    if (!before) return before.error();
    if (*before != expected) return TrashError{.reason = Reason::changed};
    if (const auto where = folderFor(path); !where) return where.error();
    if (const auto error = fault()) return *error;
    const TrashedFile planned{
        .folder = folder, .name = freeName(path), .path = path, .state = expected};
    if (!ready(planned)) return TrashError{.reason = Reason::declined};
    const std::lock_guard lock(mutex_);
    const auto found = files.find(path);
    if (found == files.end() || found->second != expected)
      return TrashError{.reason = Reason::changed};
    files.erase(found);
    trashed.push_back(planned);
    return planned;
  }

  [[nodiscard]] std::optional<TrashError> restore(const TrashedFile& file,
                                                  Folders folders) override {
    if (!isPath(file.path)) return invalid();
    if (const auto error = fault()) return error;
    const std::lock_guard lock(mutex_);
    const auto found = std::find(trashed.begin(), trashed.end(), file);
    if (found == trashed.end()) return TrashError{.reason = Reason::emptied};
    const std::string parent = parentOf(file.path);
    if (missingFolders.contains(parent) && folders == Folders::leave)
      return TrashError{.reason = Reason::folderMissing};
    if (files.contains(file.path)) return TrashError{.reason = Reason::occupied};
    missingFolders.erase(parent);
    files[file.path] = file.state;
    trashed.erase(found);
    return std::nullopt;
  }

  [[nodiscard]] Result<std::vector<TrashedFile>, TrashError> contents(
      const std::string& trash) override {
    const std::lock_guard lock(mutex_);
    std::vector<TrashedFile> found;
    for (const TrashedFile& file : trashed)
      if (file.folder == trash) found.push_back(file);
    std::sort(found.begin(), found.end(),
              [](const TrashedFile& a, const TrashedFile& b) { return a.name < b.name; });
    return found;
  }

 private:
  using Reason = TrashError::Reason;

  static bool isPath(const std::string& path) { return path.starts_with('/') && !isCutShort(path); }
  static std::string parentOf(const std::string& path) { return path.substr(0, path.rfind('/')); }
  static TrashError invalid() {
    return {.reason = Reason::failed, .code = std::make_error_code(std::errc::invalid_argument)};
  }

  std::optional<TrashError> fault() const {
    const Fault fault = faults->nextInTime();
    if (fault == Fault::absent) return TrashError{.reason = Reason::noTrash};
    if (fault == Fault::fails)
      return TrashError{.reason = Reason::failed,
                        .code = std::make_error_code(std::errc::io_error)};
    return std::nullopt;
  }

  std::string freeName(const std::string& path) const {
    const std::lock_guard lock(mutex_);
    const std::string name = path.substr(path.rfind('/') + 1);
    std::string free = name;
    for (int number = 2; std::any_of(trashed.begin(), trashed.end(),
                                     [&](const TrashedFile& file) { return file.name == free; });)
      free = name + "." + std::to_string(number++);
    return free;
  }

  mutable std::mutex mutex_;  ///< Guards `files`, `trashed` and `missingFolders` in calls.
};

}  // namespace Varnel::Platform::Testing
