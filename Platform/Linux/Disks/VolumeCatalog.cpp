// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/VolumeCatalog.h>

#include <system_error>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/FileSystemTypes.h>
#include <Varnel/Platform/Linux/Disks/MountID.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/Linux/Disks/UdevDatabase.h>
#include <Varnel/Platform/Linux/Disks/VolumeWatch.h>

namespace Varnel::Platform::Linux {
namespace {

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

  std::vector<URL> pseudoFileSystems() override {
    const auto table = table_->current();
    return table ? table->pseudoFileSystems : std::vector<URL>();
  }

  Result<std::optional<URL>> volumeURL(const URL& url) override {
    const auto mountID = mountIDOf(url.path());
    if (!mountID) return mountID.error();
    // The table is read after the file was looked up, so it knows the file's mount.
    const auto table = table_->current();
    if (!table) return PlatformError(std::make_error_code(std::errc::no_such_file_or_directory));
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
