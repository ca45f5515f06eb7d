// SPDX-License-Identifier: MIT
#include <Scan/FolderWalk.h>

#include <algorithm>
#include <map>
#include <mutex>
#include <set>
#include <utility>

#include <Scan/DiskWork.h>
#include <Scan/FileChoice.h>
#include <Scan/Mounts.h>
#include <Scan/NamedFiles.h>
#include <Scan/NetworkNotice.h>
#include <Scan/OpenFolders.h>
#include <Scan/ScanRequest.h>
#include <Scan/TaskGroup.h>

namespace Orvane {
namespace {

/// The walk in progress. A task takes its locks once a folder.
class Walk final {
 public:
  Walk(const ScanRequest& request, FileSystem& fileSystem, DiskTurns& turns, ScanObserver& observer,
       ScanControl& control)
      : request_(request),
        fileSystem_(fileSystem),
        turns_(turns),
        notice_(observer),
        control_(control),
        group_(turns, control),
        choice_(request),
        mounts_(turns.mounts()),
        files_(request.files),
        given_(request.folders.begin(), request.folders.end()) {
    given_.insert(request.references.begin(), request.references.end());
  }

  WalkResult run() {
    // First of all, so that a scan of a missing folder ends before it begins.
    std::vector<Folder*> roots;
    for (const std::string& path : given_) {
      const auto opened = fileSystem_.openFolder(nullptr, path);
      if (!opened) {
        result_.lostRoots.push_back({path, Loss::because(opened.error())});
      } else {
        roots.push_back(&addRoot(path));
        roots.back()->identity = (*opened)->identity();
        givenIdentities_.insert(roots.back()->identity);
      }
    }
    if (result_.lostRoots.empty()) {
      for (Folder* root : roots) {
        const std::string path = pathOf(*root);
        // A device that is known already may be mounted here once more, and stay so longer.
        (void)turns_.diskOf(path);
        enqueue(*deviceAt(root->identity.device, path).work, {root});
      }
      group_.wait();
      walkFiles();
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

  Folder& addRoot(const std::string& path) {
    Folder& root = tree_->addGiven(path);
    root.leadsToMounts = mounts_.hasBelow(path);
    root.isReference =
        std::any_of(request_.references.begin(), request_.references.end(),
                    [&](const std::string& reference) { return liesIn(path, reference); });
    if (const ScanMount* const mount = mounts_.around(path)) notice_.sayIfNetwork(*mount);
    return root;
  }

  /// Walks the folders that no other one led to for the sake of single files in them.
  void walkFiles() {
    if (group_.shouldStop() || !result_.lostRoots.empty()) return;
    std::vector<Folder*> roots;
    for (const std::string* path : files_.folders()) {
      roots.push_back(&addRoot(*path));
      roots.back()->isListed = false;
    }
    // Not touched before its turn, and there may be many.
    const ScanMount* last = nullptr;
    DiskWork* work = nullptr;
    for (Folder* root : roots) {
      const std::string path = pathOf(*root);
      const ScanMount* const mount = mounts_.around(path);
      if (!mount || mount != std::exchange(last, mount)) work = &workOf(mount ? mount->path : path);
      enqueue(*work, {root});
    }
    group_.wait();
  }

  /// Whether to go on in a folder of another device than the one above. What is mounted since the
  /// scan began, perhaps by its coming there, is met like this.
  [[nodiscard]] bool entersDevice(std::uint64_t identifier, const std::string& path) {
    {
      const std::lock_guard lock(mutex_);
      if (devices_.contains(identifier)) return true;
    }
    const Mounts now(turns_.mounts());
    const ScanMount* const mount = now.around(path);
    if (mount && mount->kind == ScanMount::Kind::pseudo && !mounts_.at(mount->path)) return false;
    if (mount) notice_.sayIfNetwork(*mount);
    return true;
  }

  /// The device, looked up by the path of something on it. Never under the lock, for a share that
  /// does not answer keeps its task.
  Device deviceAt(std::uint64_t identifier, const std::string& path) {
    {
      const std::lock_guard lock(mutex_);
      const auto known = devices_.find(identifier);
      if (known != devices_.end()) return known->second;
    }
    DiskWork& work = workOf(path);
    const std::lock_guard lock(mutex_);
    const Device device{tree_->deviceNumber(identifier, work.disk()), &work};
    return devices_.try_emplace(identifier, device).first->second;
  }

  DiskWork& workOf(const std::string& path) {
    const ScanDisk& disk = turns_.diskOf(path);
    const std::lock_guard lock(mutex_);
    return works_.try_emplace(&disk, disk).first->second;
  }

  void enqueue(DiskWork& work, const std::vector<Folder*>& folders) {
    if (work.add(folders)) startTask(work);
  }

  void startTask(DiskWork& work);

  void finish(DiskWork& work, Folder& folder, const std::vector<Child>& children) {
    std::vector<Folder*> folders;
    for (const Child& child : children) {
      const std::string path = folder.leadsToMounts ? pathBelow(folder, child.name) : "";
      if (const ScanMount* const mount = folder.leadsToMounts ? mounts_.at(path) : nullptr) {
        if (!enter(*mount, folder, child.name)) folder.isWhole = false;
        continue;
      }
      folders.push_back(&tree_->addFolder(
          folder, child.name, {.device = folder.identity.device, .inode = child.inode}));
      folders.back()->leadsToMounts = folder.leadsToMounts && mounts_.hasBelow(path);
    }
    enqueue(work, folders);
  }

  /// Takes in what is mounted below a folder, at its own disk. Does not open it here, for it may
  /// not answer. False when it is left out.
  bool enter(const ScanMount& mount, const Folder& above, const std::string& way) {
    if (request_.staysOnFileSystem) return false;
    if (mount.kind == ScanMount::Kind::pseudo) {
      // Where file systems are mounted on demand, they stand in one of these.
      for (const ScanMount* next : mounts_.nextBelow(mount.path)) {
        const std::string wayDown = way + next->path.substr(mount.path.size());
        if (choice_.enters(above, wayDown)) enter(*next, above, wayDown);
      }
      return false;
    }
    notice_.sayIfNetwork(mount);
    Folder& folder = tree_->addMounted(above, way);
    folder.leadsToMounts = mounts_.hasBelow(mount.path);
    enqueue(workOf(mount.path), {&folder});
    return true;
  }

  void lose(const Folder& folder, const Loss& loss) {
    if (!folder.isListed) {
      for (const std::string& name : files_.takeThoseIn(folder)) lose(folder, name, loss);
      return;
    }
    const std::lock_guard lock(mutex_);
    // Of a given folder everything is missing then.
    const bool isRoot = folder.parent == nullptr && loss.kind != Loss::Kind::incomplete;
    (isRoot ? result_.lostRoots : result_.unreadableFolders).push_back({pathOf(folder), loss});
  }

  void lose(const Folder& folder, std::string_view name, const Loss& loss) {
    const std::lock_guard lock(mutex_);
    result_.unreadableFiles.push_back({pathBelow(folder, name), loss});
  }

  const ScanRequest& request_;
  FileSystem& fileSystem_;
  DiskTurns& turns_;
  NetworkNotice notice_;
  ScanControl& control_;
  TaskGroup group_;
  const FileChoice choice_;
  const Mounts mounts_;
  NamedFiles files_;
  std::set<std::string> given_;  ///< Complete before the tasks begin, as the next.
  std::set<FileIdentity> givenIdentities_;
  std::shared_ptr<FileTree> tree_ = std::make_shared<FileTree>();

  std::mutex mutex_;  ///< Owns what follows.
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
    while (!walk_.group_.shouldStop()) {
      if (!folder_ && !(folder_ = work_.take())) return std::nullopt;
      if (!listing_ && !begin()) {
        folder_ = nullptr;
      } else if (!goOn()) {
        walk_.finish(work_, *folder_, children_);
        listing_ = nullptr;
        folder_ = nullptr;
        children_.clear();
      }
      if (turn.isOver()) return folder_ ? folder_->identity.inode : 0;
    }
    if (folder_) folder_->isWhole = false;
    return std::nullopt;
  }

  void refuse() override {
    const Loss loss{Loss::Kind::unreadable, std::make_error_code(std::errc::no_such_device)};
    if (folder_) {
      folder_->isWhole = false;
      walk_.lose(*folder_, loss);
    }
    while (const Folder* folder = work_.take()) walk_.lose(*folder, loss);
  }

 private:
  /// Opens the folder. False when it is not to be listed, or not here.
  bool begin() {
    const auto opened = open_.open(*folder_);
    if (!opened) {
      if (opened.error() != std::errc::not_a_directory || !isUnseen(*folder_))
        walk_.lose(*folder_, Loss::because(opened.error()));
      return false;
    }
    const FileIdentity identity = (*opened)->identity();
    if (folder_->parent) {
      if (isOnTheWay(identity, *folder_->parent)) return false;
      if (walk_.request_.staysOnFileSystem && identity.device != folder_->parent->identity.device)
        return false;
      if (identity.device != folder_->parent->identity.device &&
          !walk_.entersDevice(identity.device, pathOf(*folder_)))
        return false;
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
    stage_ = folder_->isListed ? Stage::opened : Stage::listed;
    folder_->isWhole = folder_->isListed;
    named_ = walk_.files_.takeThoseIn(*folder_);
    nextNamed_ = named_.begin();
    return true;
  }

  /// Takes in the next entries. False after the last.
  bool goOn() {
    found_ = 0;
    const bool more = (stage_ != Stage::listed && listSome()) || lookAtSome();
    walk_.control_.filesFound.fetch_add(found_, std::memory_order_relaxed);
    return more;
  }

  bool listSome() {
    const auto more = listing_->list(visit_);
    if (!more) {
      const Loss loss = Loss::because(more.error());
      walk_.lose(*folder_,
                 stage_ == Stage::listing ? Loss{Loss::Kind::incomplete, loss.error} : loss);
      folder_->isWhole = false;
    } else if (stage_ == Stage::opened) {
      const std::lock_guard lock(walk_.mutex_);
      ++walk_.result_.folders;
    }
    stage_ = more && *more ? Stage::listing : Stage::listed;
    return more && *more;
  }

  void visit(const FolderEntry& entry) {
    switch (entry.kind) {
      case FolderEntry::Kind::file:
        if (std::binary_search(named_.begin(), named_.end(), entry.name)) break;
        if (mayTakePart(entry)) return take(entry);
        break;
      case FolderEntry::Kind::folder:
        if (walk_.choice_.enters(*folder_, entry.name))
          return children_.push_back({writer_.add(entry.name), entry.inode});
        break;
      case FolderEntry::Kind::failure:
        walk_.lose(*folder_, entry.name, Loss::because(entry.error));
        break;
      case FolderEntry::Kind::other:
        break;
    }
    folder_->isWhole = false;
  }

  [[nodiscard]] bool mayTakePart(const FolderEntry& entry) const {
    if (!walk_.choice_.takes(*folder_, entry.name)) return false;
    // A file, too, may have one mounted over it.
    return !walk_.request_.staysOnFileSystem || !folder_->leadsToMounts ||
           !walk_.mounts_.at(pathBelow(*folder_, entry.name));
  }

  void take(const FolderEntry& file) {
    if (!walk_.choice_.hasChosenSize(file.status.size)) {
      folder_->isWhole = false;
      return;
    }
    ++found_;
    remember(file.status.identity.device, file.name);
    writer_.add(*folder_, file.name, file.status, device_.number);
  }

  /// Looks at the next of the folder's single files, once it is listed, or in place of that. False
  /// after the last.
  bool lookAtSome() {
    constexpr std::ptrdiff_t maxLooks = 32;
    const auto end = nextNamed_ + std::min(maxLooks, named_.end() - nextNamed_);
    for (; nextNamed_ != end; ++nextNamed_) {
      const FolderEntry entry = listing_->look(nextNamed_->c_str());
      if (entry.kind == FolderEntry::Kind::file) {
        take(entry);
      } else {
        walk_.lose(*folder_, entry.name, NamedFiles::lossOf(entry));
      }
    }
    return nextNamed_ != named_.end();
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
  enum class Stage { opened, listing, listed } stage_ = Stage::opened;
  std::vector<Child> children_;
  std::vector<std::string> named_;  ///< Its single files, which are taken after the others.
  std::vector<std::string>::const_iterator nextNamed_;
  std::uint64_t found_ = 0;
  std::uint64_t deviceIdentifier_ = 0;
  Device device_{};
};

void Walk::startTask(DiskWork& work) {
  group_.start(work.disk(), std::make_unique<Task>(*this, work));
}

}  // namespace

WalkResult walkFolders(const ScanRequest& request, FileSystem& fileSystem, DiskTurns& turns,
                       ScanObserver& observer, ScanControl& control) {
  return Walk(request, fileSystem, turns, observer, control).run();
}

}  // namespace Orvane
