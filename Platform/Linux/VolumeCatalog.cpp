// SPDX-License-Identifier: MIT
#include <Platform/Ports/VolumeCatalog.h>

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <system_error>
#include <utility>

#include <Platform/Linux/Adapters.h>
#include <Platform/Linux/FileSystemTypes.h>
#include <Platform/Linux/MountTable.h>
#include <Platform/Linux/UdevDatabase.h>
#include <Platform/Linux/VolumeWatch.h>

namespace Varnel::Platform::Linux {
namespace {

PlatformError systemError(int number) {
  return PlatformError(std::error_code(number, std::generic_category()));
}

// The mount that a file lies on. A symbolic link lies where it is, not where it points.
Result<int> mountIDOf(const URL& url) {
  const std::string path = url.path();
  // The system would look up what stands before the zero.
  if (path.find('\0') != std::string::npos) return systemError(EINVAL);
  struct statx facts {};
  constexpr int flags = AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT | AT_STATX_DONT_SYNC;
  if (::statx(AT_FDCWD, path.c_str(), flags, STATX_MNT_ID, &facts) != 0) return systemError(errno);
  if ((facts.stx_mask & STATX_MNT_ID) == 0) return systemError(ENOTSUP);
  return static_cast<int>(facts.stx_mnt_id);
}

class MountTableCatalog final : public VolumeCatalog {
 public:
  explicit MountTableCatalog(std::shared_ptr<MountTable> table) : table_(std::move(table)) {}

  std::vector<MountedVolume> mountedVolumes() override {
    const auto table = table_->current();
    if (!table) return {};
    // Not kept with the table: udev writes its links some time after a disk was plugged in.
    const auto uuids = fileSystemUUIDs();
    std::vector<MountedVolume> volumes;
    volumes.reserve(table->volumes.size());
    for (const Volume& volume : table->volumes) {
      MountedVolume mounted{.url = volume.url,
                            .isLocal = !isNetworkFileSystem(volume.type),
                            .isInternal = volume.isInternal,
                            .uuid = std::nullopt};
      for (const std::string& name : volume.deviceNames)
        if (const auto found = uuids.find(name); found != uuids.end()) mounted.uuid = found->second;
      volumes.push_back(std::move(mounted));
    }
    return volumes;
  }

  Result<std::optional<URL>> volumeURL(const URL& url) override {
    const auto mountID = mountIDOf(url);
    if (!mountID) return mountID.error();
    // Asked after the file, the table knows the mount that the file was found on.
    const auto table = table_->current();
    if (!table) return systemError(ENOENT);
    const Volume* volume = table->withMountID(*mountID);
    return volume ? std::optional(volume->url) : std::nullopt;
  }

  std::optional<std::string> volumeName(const URL& volumeURL) override {
    const auto table = table_->current();
    if (!table) return std::nullopt;
    for (const Volume& volume : table->volumes) {
      if (volume.url != volumeURL) continue;
      for (const std::string& device : volume.deviceNames)
        if (const auto label = udevProperty(device, "ID_FS_LABEL_ENC")) return udevDecoded(*label);
      return volumeURL.lastPathComponent();
    }
    return std::nullopt;
  }

  std::unique_ptr<Subscription> subscribe(ChangeHandler handler) override {
    return VolumeWatch::start(table_, std::move(handler));
  }

 private:
  const std::shared_ptr<MountTable> table_;
};

}  // namespace

std::unique_ptr<VolumeCatalog> makeVolumeCatalog(std::shared_ptr<MountTable> table) {
  return std::make_unique<MountTableCatalog>(std::move(table));
}

}  // namespace Varnel::Platform::Linux
