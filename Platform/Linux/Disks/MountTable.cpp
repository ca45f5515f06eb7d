// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/MountTable.h>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <numeric>
#include <optional>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/BlockDevices.h>
#include <Varnel/Platform/Linux/Disks/FileSystemTypes.h>
#include <Varnel/Platform/Linux/Disks/MountID.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>

namespace Varnel::Platform::Linux {
namespace {

constexpr std::size_t leastRoom = 8192;
constexpr int maxAttempts = 4;

// Finds the block devices below mounts.
class DeviceNames final {
 public:
  std::vector<std::string> of(const Mount& mount) {
    std::string device = mount.device;
    if (device.starts_with("0:")) {
      // btrfs has device numbers of its own making, and its source is a block device. For other
      // types the source is any text of the user's choice.
      if (mount.type != "btrfs") return {};
      struct stat node {};
      if (::stat(mount.source.c_str(), &node) != 0 || !S_ISBLK(node.st_mode)) return {};
      device = std::to_string(major(node.st_rdev)) + ':' + std::to_string(minor(node.st_rdev));
    }
    const auto link = byNumber_.link(device);
    if (!link) return {};
    std::string name(lastComponent(*link));
    if (mount.type == "btrfs") return membersBeside(std::move(name));
    return {std::move(name)};
  }

 private:
  // All the devices of the btrfs file system that this one belongs to.
  static std::vector<std::string> membersBeside(std::string name) {
    const KernelFolder fileSystems("/sys/fs/btrfs");
    for (const std::string& uuid : fileSystems.names()) {
      auto members = fileSystems.names(uuid + "/devices");
      if (std::find(members.begin(), members.end(), name) != members.end()) return members;
    }
    return {std::move(name)};
  }

  const KernelFolder byNumber_{"/sys/dev/block"};
};

// The mount that the root folder lies on, as far as the folder itself tells.
std::optional<Mount> mountOfRootFolder() {
  const auto id = mountIDOf("/");
  struct stat facts {};
  if (!id || ::stat("/", &facts) != 0) return std::nullopt;
  Mount mount;
  mount.id = *id;
  mount.device = std::to_string(major(facts.st_dev)) + ':' + std::to_string(minor(facts.st_dev));
  mount.target = "/";
  return mount;
}

std::vector<Mount> visibleMounts(std::string_view mountInfo) {
  std::vector<Mount> mounts = reachableMounts(parseMountInfo(mountInfo));
  const bool hasRoot =
      std::any_of(mounts.begin(), mounts.end(), [](const Mount& m) { return m.target == "/"; });
  // The table of a process whose root folder was changed does not list the mount that the folder
  // lies on.
  if (!hasRoot)
    if (auto root = mountOfRootFolder()) mounts.insert(mounts.begin(), *std::move(root));
  return mounts;
}

std::shared_ptr<const VolumeTable> makeTable(std::string_view mountInfo) {
  auto table = std::make_shared<VolumeTable>();
  const BlockDevices devices;
  DeviceNames deviceNames;
  for (Mount& mount : visibleMounts(mountInfo)) {
    if (!mount.target.ends_with('/')) mount.target += '/';
    if (isPseudoFileSystem(mount.type)) {
      table->pseudoFileSystems.push_back(URL::fileURLWithPath(mount.target));
      continue;
    }
    auto names = deviceNames.of(mount);
    const auto internal = devices.areInternal(names);
    table->volumes.push_back({.mountID = mount.id,
                              .device = std::move(mount.device),
                              .type = std::move(mount.type),
                              .url = URL::fileURLWithPath(mount.target),
                              .deviceNames = std::move(names),
                              .isInternal = internal});
  }
  table->byMountID.resize(table->volumes.size());
  std::iota(table->byMountID.begin(), table->byMountID.end(), std::size_t{0});
  std::sort(table->byMountID.begin(), table->byMountID.end(), [&](std::size_t a, std::size_t b) {
    return table->volumes[a].mountID < table->volumes[b].mountID;
  });
  return table;
}

}  // namespace

POSIX::FileDescriptor openMountInfo() {
  return POSIX::FileDescriptor(::open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC));
}

bool readWhole(const POSIX::FileDescriptor& file, std::string& buffer) {
  std::size_t size = 0;
  for (;;) {
    if (buffer.size() < size + leastRoom) buffer.resize(size * 2 + leastRoom);
    const ssize_t count =
        ::pread(file.get(), buffer.data() + size, buffer.size() - size, static_cast<off_t>(size));
    if (count < 0) return false;
    if (count == 0) break;
    size += static_cast<std::size_t>(count);
  }
  buffer.resize(size);
  return true;
}

const Volume* VolumeTable::withMountID(int mountID) const {
  const auto found = std::lower_bound(
      byMountID.begin(), byMountID.end(), mountID,
      [this](std::size_t position, int id) { return volumes[position].mountID < id; });
  if (found == byMountID.end() || volumes[*found].mountID != mountID) return nullptr;
  return &volumes[*found];
}

std::shared_ptr<MountTable> makeMountTable() {
  return std::make_shared<MountTable>();
}

MountTable::MountTable() = default;
MountTable::~MountTable() = default;

bool MountTable::hasChanged() const {
  pollfd waiting{.fd = file_.get(), .events = POLLPRI, .revents = 0};
  return ::poll(&waiting, 1, 0) > 0;
}

std::shared_ptr<const VolumeTable> MountTable::current() {
  const std::lock_guard lock(mutex_);
  if (!file_) file_ = openMountInfo();
  if (!file_) return nullptr;
  // The kernel tells of each change only once, so the thread that hears of it must read. The table
  // comes in pieces, which may not fit together if it changes in between.
  for (int attempt = 0; attempt < maxAttempts; ++attempt) {
    if (hasChanged()) isStale_ = true;
    if (!isStale_) break;
    if (!readWhole(file_, buffer_)) break;
    table_ = makeTable(buffer_);
    isStale_ = false;
  }
  return table_;
}

}  // namespace Varnel::Platform::Linux
