// SPDX-License-Identifier: MIT
#include <Scan/FolderWalk.h>

#include <algorithm>
#include <map>
#include <mutex>
#include <set>
#include <utility>

#include <Scan/OpenFolders.h>
#include <Scan/ScanObserver.h>
#include <Scan/TaskGroup.h>

namespace Orvane {
namespace {

/// A second task pays off once this many folders wait for it.
constexpr std::size_t worthATask = 4;

/// Whether the folder is `folder` or one of those above it, up to the root of the walk.
bool isOnTheWay(const FileIdentity& identity, const Folder* folder) {
  for (; folder != nullptr; folder = folder->parent)
    if (folder->identity == identity) return true;
  return false;
}

/// What is left to do at one disk.
struct DiskWork {
  const ScanDisk* disk;
  std::set<std::pair<std::uint64_t, Folder*>> pending{};  ///< By inode.
  std::uint64_t position = 0;                             ///< The inode that was taken last.
  unsigned tasks = 0;
};

/// The walk in progress. Its lock guards all but the tree; a task takes it once a folder.
/// Invariant: while folders of a disk are pending, a task of that disk runs.
class Walk final {
 public:
  Walk(const std::vector<std::string>& folders, FileSystem& fileSystem, DiskTurns& turns,
       ScanControl& control)
      : fileSystem_(fileSystem),
        turns_(turns),
        control_(control),
        group_(turns, control),
        given_(folders.begin(), folders.end()) {}

  WalkResult run() {
    // First of all, so that a scan of a missing folder ends before it begins.
    std::vector<Folder*> roots;
    for (const std::string& path : given_) {
      const auto opened = fileSystem_.openFolder(nullptr, path);
      if (!opened) {
        result_.lostRoots.push_back({path, Loss::because(opened.error())});
      } else {
        roots.push_back(&tree_->addGiven(path));
        roots.back()->identity = (*opened)->identity();
        givenIdentities_.insert(roots.back()->identity);
      }
    }
    if (result_.lostRoots.empty()) {
      for (Folder* root : roots) {
        const std::string path = pathOf(*root);
        // A device that is known already may be mounted here once more, and stay so longer.
        (void)turns_.diskOf(path);
        enqueue(workAt(root->identity.device, path), {root});
      }
      group_.wait();
    }
    const auto byPath = [](const LostPath& a, const LostPath& b) { return a.path < b.path; };
    std::sort(result_.unreadableFiles.begin(), result_.unreadableFiles.end(), byPath);
    std::sort(result_.unreadableFolders.begin(), result_.unreadableFolders.end(), byPath);
    result_.tree = std::move(tree_);
    return std::move(result_);
  }

 private:
  class Task;
  struct Device {
    std::uint32_t number;
    DiskWork* work;
  };
  struct Child {
    const char* name;
    std::uint64_t inode;
  };

  /// The device, looked up by the path of something on it. Never under the lock, for a share that
  /// does not answer keeps its task.
  Device deviceAt(std::uint64_t identifier, const std::string& path) {
    {
      const std::lock_guard lock(mutex_);
      const auto known = devices_.find(identifier);
      if (known != devices_.end()) return known->second;
    }
    const ScanDisk& disk = turns_.diskOf(path);
    const std::lock_guard lock(mutex_);
    DiskWork& work = works_.try_emplace(&disk, DiskWork{&disk}).first->second;
    const Device device{tree_->deviceNumber(identifier, disk), &work};
    return devices_.try_emplace(identifier, device).first->second;
  }

  DiskWork& workAt(std::uint64_t device, const std::string& path) {
    return *deviceAt(device, path).work;
  }

  void enqueue(DiskWork& work, const std::vector<Folder*>& folders) {
    bool needsTask = false;
    {
      const std::lock_guard lock(mutex_);
      for (Folder* folder : folders) work.pending.emplace(folder->identity.inode, folder);
      needsTask = !work.pending.empty() &&
                  (work.tasks == 0 || (work.tasks < work.disk->places &&
                                       work.pending.size() >= work.tasks * worthATask));
      if (needsTask) ++work.tasks;
    }
    if (needsTask) startTask(work);
  }

  void startTask(DiskWork& work);

  /// The folder from which the way to all others is short: the next after the last.
  Folder* take(DiskWork& work) {
    const std::lock_guard lock(mutex_);
    if (work.pending.empty()) {
      --work.tasks;
      return nullptr;
    }
    auto next = work.pending.lower_bound({work.position, nullptr});
    if (next == work.pending.end()) next = work.pending.begin();
    Folder* const folder = next->second;
    work.position = next->first;
    work.pending.erase(next);
    return folder;
  }

  void finish(DiskWork& work, const Folder& folder, const std::vector<Child>& children) {
    std::vector<Folder*> folders;
    for (const Child& child : children)
      folders.push_back(&tree_->addFolder(
          folder, child.name, {.device = folder.identity.device, .inode = child.inode}));
    enqueue(work, folders);
  }

  void lose(const Folder& folder, const Loss& loss) {
    const std::lock_guard lock(mutex_);
    // Of a given folder everything is missing then.
    const bool isRoot = folder.parent == nullptr && loss.kind != Loss::Kind::incomplete;
    (isRoot ? result_.lostRoots : result_.unreadableFolders).push_back({pathOf(folder), loss});
  }

  FileSystem& fileSystem_;
  DiskTurns& turns_;
  ScanControl& control_;
  TaskGroup group_;
  const std::set<std::string> given_;
  std::set<FileIdentity> givenIdentities_;  ///< Complete before the tasks begin.
  std::shared_ptr<FileTree> tree_ = std::make_shared<FileTree>();

  std::mutex mutex_;
  std::map<const ScanDisk*, DiskWork> works_;
  std::map<std::uint64_t, Device> devices_;
  WalkResult result_;
};

/// Lists folders of one disk. A folder with many entries goes on in the next turn.
class Walk::Task final : public TaskGroup::Task {
 public:
  Task(Walk& walk, DiskWork& work)
      : walk_(walk), work_(work), writer_(*walk.tree_), open_(walk.fileSystem_) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    do {
      if (walk_.group_.shouldStop()) return std::nullopt;
      if (!folder_ && !(folder_ = walk_.take(work_))) return std::nullopt;
      if (!listing_ && !begin()) {
        folder_ = nullptr;
      } else if (!listSome()) {
        folder_->isWhole = isWhole_;
        walk_.finish(work_, *folder_, children_);
        listing_ = nullptr;
        folder_ = nullptr;
        children_.clear();
      }
    } while (!turn.isOver());
    return folder_ ? folder_->identity.inode : 0;
  }

  void refuse() override {
    const Loss loss{Loss::Kind::unreadable, std::make_error_code(std::errc::no_such_device)};
    if (folder_) walk_.lose(*folder_, loss);
    while (const Folder* folder = walk_.take(work_)) walk_.lose(*folder, loss);
  }

 private:
  /// Opens the folder. False when it is not to be listed, or not here.
  bool begin() {
    const auto opened = open_.open(*folder_);
    if (!opened) {
      walk_.lose(*folder_, Loss::because(opened.error()));
      return false;
    }
    const FileIdentity identity = (*opened)->identity();
    if (folder_->parent) {
      if (isOnTheWay(identity, folder_->parent)) return false;
      // A given folder that lies in another one is walked by itself.
      if (walk_.givenIdentities_.contains(identity) && walk_.given_.contains(pathOf(*folder_)))
        return false;
    }
    folder_->identity = identity;
    remember(identity.device, nullptr);
    if (device_.work != &work_) {
      walk_.enqueue(*device_.work, {folder_});
      return false;
    }
    listing_ = *opened;
    isListed_ = false;
    isWhole_ = true;
    return true;
  }

  /// Takes in the next entries. False after the last.
  bool listSome() {
    found_ = 0;
    const auto more = listing_->list(visit_);
    walk_.control_.filesFound.fetch_add(found_, std::memory_order_relaxed);
    if (!more) {
      isWhole_ = false;
      const Loss loss = Loss::because(more.error());
      walk_.lose(*folder_, isListed_ ? Loss{Loss::Kind::incomplete, loss.error} : loss);
    }
    if (!isListed_ && more) {
      isListed_ = true;
      const std::lock_guard lock(walk_.mutex_);
      ++walk_.result_.folders;
    }
    return more && *more;
  }

  void visit(const FolderEntry& entry) {
    switch (entry.kind) {
      case FolderEntry::Kind::file:
        ++found_;
        remember(entry.status.identity.device, entry.name);
        writer_.add(*folder_, entry.name, entry.status, device_.number);
        break;
      case FolderEntry::Kind::folder:
        children_.push_back({writer_.add(entry.name), entry.inode});
        break;
      case FolderEntry::Kind::other:
        isWhole_ = false;
        break;
      case FolderEntry::Kind::failure: {
        isWhole_ = false;
        const std::lock_guard lock(walk_.mutex_);
        walk_.result_.unreadableFiles.push_back(
            {pathBelow(*folder_, entry.name), Loss::because(entry.error)});
        break;
      }
    }
  }

  /// Makes `device_` the one of the folder or of a file in it.
  void remember(std::uint64_t identifier, const char* name) {
    if (device_.work && identifier == deviceIdentifier_) return;
    device_ = walk_.deviceAt(identifier, name ? pathBelow(*folder_, name) : pathOf(*folder_));
    deviceIdentifier_ = identifier;
  }

  Walk& walk_;
  DiskWork& work_;
  FileTree::Writer writer_;
  OpenFolders open_;
  const std::function<void(const FolderEntry&)> visit_ = [this](const auto& entry) {
    visit(entry);
  };

  Folder* folder_ = nullptr;       ///< The one that is listed, and what it held so far.
  OpenFolder* listing_ = nullptr;  ///< In `open_`.
  bool isListed_ = false;
  bool isWhole_ = false;  ///< Whether all of it so far is in the tree.
  std::vector<Child> children_;
  std::uint64_t found_ = 0;
  std::uint64_t deviceIdentifier_ = 0;
  Device device_{};
};

void Walk::startTask(DiskWork& work) {
  group_.start(*work.disk, std::make_unique<Task>(*this, work));
}

}  // namespace

WalkResult walkFolders(const std::vector<std::string>& folders, FileSystem& fileSystem,
                       DiskTurns& turns, ScanControl& control) {
  return Walk(folders, fileSystem, turns, control).run();
}

}  // namespace Orvane
