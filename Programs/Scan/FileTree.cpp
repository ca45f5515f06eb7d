// SPDX-License-Identifier: MIT
#include <Scan/FileTree.h>

#include <algorithm>
#include <condition_variable>
#include <iterator>
#include <mutex>
#include <set>
#include <string_view>
#include <utility>

#include <Scan/ScanObserver.h>
#include <Scan/ThreadTeam.h>

namespace Orvane {
namespace {

/// The path of the entry with this name in the folder. Works without recursion, however deep the
/// folder lies.
std::string pathBelow(const Folder* folder, std::string_view name) {
  std::size_t size = name.size();
  for (const Folder* each = folder; each != nullptr; each = each->parent)
    size += each->name.size() + 1;
  std::string path(size, '/');
  auto begin = std::copy_backward(name.begin(), name.end(), path.end());
  for (; folder != nullptr; folder = folder->parent)
    begin = std::copy_backward(folder->name.begin(), folder->name.end(), begin - 1);
  return path;
}

/// Whether the folder is `folder` or one of those above it, up to the root of the walk.
bool isOnTheWay(const FileIdentity& identity, const Folder* folder) {
  for (; folder != nullptr; folder = folder->parent)
    if (folder->identity == identity) return true;
  return false;
}

/// The walk in progress. The stack of folders still to be listed, and with it the end of the walk,
/// is guarded by the mutex; so is the tree, which takes in one folder's files at a time.
class Walk final {
 public:
  Walk(const std::vector<std::string>& folders, FileSystem& fileSystem, ScanControl& control)
      : fileSystem_(fileSystem), control_(control), given_(folders.begin(), folders.end()) {}

  /// Lists the given folders first, so that a scan of a missing folder ends before it begins.
  [[nodiscard]] bool start() {
    for (const std::string& path : given_) {
      ++running_;
      finish(visit({nullptr, path == "/" ? "" : path}));
    }
    return tree_.lostRoots.empty();
  }

  void work() {
    try {
      Folder folder;
      while (take(folder)) finish(visit(std::move(folder)));
    } catch (...) {
      stop();
      throw;
    }
  }

  FileTree takeTree() {
    const auto byPath = [](const LostPath& a, const LostPath& b) { return a.path < b.path; };
    std::sort(tree_.unreadableFiles.begin(), tree_.unreadableFiles.end(), byPath);
    std::sort(tree_.unreadableFolders.begin(), tree_.unreadableFolders.end(), byPath);
    return std::move(tree_);
  }

 private:
  bool take(Folder& folder) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return isStopped_ || !pending_.empty() || running_ == 0; });
    if (isStopped_ || pending_.empty()) return false;
    folder = std::move(pending_.back());
    pending_.pop_back();
    ++running_;
    return true;
  }

  /// Lists the folder, files its content and returns the folders in it.
  std::vector<Folder> visit(Folder folder) {
    const std::string path = folder.path();
    // A given folder that lies in another one is walked by itself.
    if (folder.parent != nullptr && given_.contains(path)) return {};
    FileResult<FolderListing> listing = fileSystem_.list(path);
    const std::lock_guard lock(mutex_);
    if (!listing) {
      (folder.parent != nullptr ? tree_.unreadableFolders : tree_.lostRoots)
          .push_back({path, Loss::because(listing.error())});
      return {};
    }
    if (isOnTheWay(listing->identity, folder.parent)) return {};
    folder.identity = listing->identity;
    const Folder& kept = tree_.folders.emplace_back(std::move(folder));
    if (listing->interruption)
      tree_.unreadableFolders.push_back({path, {Loss::Kind::incomplete, listing->interruption}});
    for (FolderListing::File& file : listing->files)
      tree_.files.push_back({&kept, std::move(file.name), file.status});
    for (const FolderListing::Failure& failure : listing->failures)
      tree_.unreadableFiles.push_back(
          {pathBelow(&kept, failure.name), Loss::because(failure.error)});
    control_.filesFound.store(tree_.files.size(), std::memory_order_relaxed);

    std::vector<Folder> folders;
    for (std::string& name : listing->folders) folders.push_back({&kept, std::move(name)});
    return folders;
  }

  void finish(std::vector<Folder> folders) {
    {
      const std::lock_guard lock(mutex_);
      std::move(folders.begin(), folders.end(), std::back_inserter(pending_));
      --running_;
      if (control_.isCancelled) isStopped_ = true;
    }
    changed_.notify_all();
  }

  void stop() {
    {
      const std::lock_guard lock(mutex_);
      isStopped_ = true;
    }
    changed_.notify_all();
  }

  FileSystem& fileSystem_;
  ScanControl& control_;
  std::mutex mutex_;
  std::condition_variable changed_;
  const std::set<std::string> given_;
  std::vector<Folder> pending_;
  std::size_t running_ = 0;
  bool isStopped_ = false;
  FileTree tree_;
};

}  // namespace

std::string Folder::path() const {
  return parent == nullptr && name.empty() ? "/" : pathBelow(parent, name);
}

std::string FileRecord::path() const {
  return pathBelow(folder, name);
}

bool pathPrecedes(const FileRecord& first, const FileRecord& second) {
  return first.folder == second.folder ? first.name < second.name : first.path() < second.path();
}

FileTree walkFolders(const std::vector<std::string>& folders, FileSystem& fileSystem,
                     unsigned threads, ScanControl& control) {
  Walk walk(folders, fileSystem, control);
  if (walk.start()) runOnThreads(threads, [&](unsigned) { walk.work(); });
  return walk.takeTree();
}

}  // namespace Orvane
