// SPDX-License-Identifier: MIT
#include <orvane/Scan/FileTree.h>

#include <algorithm>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <string_view>
#include <unordered_set>
#include <utility>

#include <orvane/Scan/ScanObserver.h>
#include <orvane/Scan/ThreadTeam.h>

namespace Orvane {
namespace {

std::string joined(std::string_view folder, std::string_view name) {
  std::string path;
  path.reserve(folder.size() + 1 + name.size());
  path = folder;
  if (!path.ends_with('/')) path += '/';
  return path += name;
}

/// The folders on the way from a given folder down to one that is being walked.
struct Ancestry {
  FileIdentity identity;
  std::shared_ptr<const Ancestry> parent;
};

bool holds(const Ancestry* ancestry, const FileIdentity& identity) {
  for (; ancestry != nullptr; ancestry = ancestry->parent.get())
    if (ancestry->identity == identity) return true;
  return false;
}

struct Task {
  std::string folder;
  std::shared_ptr<const Ancestry> ancestry;
};

/// The walk in progress. The stack of folders still to be listed, and with it the end of the walk,
/// is guarded by the mutex; so is the tree, which takes in one folder's files at a time.
class Walk final {
 public:
  Walk(const std::vector<std::string>& folders, FileSystem& fileSystem, ScanControl& control)
      : fileSystem_(fileSystem), control_(control) {
    for (const std::string& folder : folders) push({folder, nullptr});
  }

  void work() {
    try {
      Task task;
      while (take(task)) finish(visit(task));
    } catch (...) {
      stop();
      throw;
    }
  }

  FileTree takeTree() {
    const auto byPath = [](const FileTree::Failure& a, const FileTree::Failure& b) {
      return a.path < b.path;
    };
    std::sort(tree_.unreadableFiles.begin(), tree_.unreadableFiles.end(), byPath);
    std::sort(tree_.unreadableFolders.begin(), tree_.unreadableFolders.end(), byPath);
    return std::move(tree_);
  }

 private:
  void push(Task task) {
    if (seen_.insert(task.folder).second) tasks_.push_back(std::move(task));
  }

  bool take(Task& task) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return isStopped_ || !tasks_.empty() || running_ == 0; });
    if (isStopped_ || tasks_.empty()) return false;
    task = std::move(tasks_.back());
    tasks_.pop_back();
    ++running_;
    return true;
  }

  /// Lists the folder, files its content and returns the folders in it.
  std::vector<Task> visit(const Task& task) {
    FileResult<FolderListing> listing = fileSystem_.list(task.folder);
    const std::lock_guard lock(mutex_);
    if (!listing) {
      tree_.unreadableFolders.push_back({task.folder, Loss::because(listing.error())});
      return {};
    }
    if (holds(task.ancestry.get(), listing->identity)) return {};
    const std::string& folder = tree_.folders.emplace_back(task.folder);
    for (FolderListing::File& file : listing->files)
      tree_.files.push_back({&folder, std::move(file.name), file.status});
    for (const FolderListing::Failure& failure : listing->failures)
      tree_.unreadableFiles.push_back({joined(folder, failure.name), Loss::because(failure.error)});
    control_.filesFound.store(tree_.files.size(), std::memory_order_relaxed);

    const auto ancestry = std::make_shared<Ancestry>(Ancestry{listing->identity, task.ancestry});
    std::vector<Task> tasks;
    for (const std::string& name : listing->folders)
      tasks.push_back({joined(folder, name), ancestry});
    return tasks;
  }

  void finish(std::vector<Task> tasks) {
    {
      const std::lock_guard lock(mutex_);
      for (Task& task : tasks) push(std::move(task));
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
  std::vector<Task> tasks_;
  std::unordered_set<std::string> seen_;
  std::size_t running_ = 0;
  bool isStopped_ = false;
  FileTree tree_;
};

}  // namespace

std::string FileRecord::path() const {
  return joined(*folder, name);
}

bool pathPrecedes(const FileRecord& first, const FileRecord& second) {
  return first.folder == second.folder ? first.name < second.name : first.path() < second.path();
}

FileTree walkFolders(const std::vector<std::string>& folders, FileSystem& fileSystem,
                     unsigned threads, ScanControl& control) {
  Walk walk(folders, fileSystem, control);
  runOnThreads(threads, [&](unsigned) { walk.work(); });
  return walk.takeTree();
}

}  // namespace Orvane
