// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/DiskArbitration.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>

namespace Varnel::Platform::Linux {
namespace {

class MountTableSession final : public DiskArbitration::Session {
 public:
  explicit MountTableSession(std::shared_ptr<const VolumeTable> table) : table_(std::move(table)) {}

  std::vector<URL> mountURLs(const std::string& deviceName) override {
    std::vector<URL> urls;
    for (const Volume& volume : table_->volumes)
      if (std::find(volume.deviceNames.begin(), volume.deviceNames.end(), deviceName) !=
          volume.deviceNames.end())
        urls.push_back(volume.url);
    return urls;
  }

 private:
  const std::shared_ptr<const VolumeTable> table_;
};

class MountTableArbitration final : public DiskArbitration {
 public:
  explicit MountTableArbitration(std::shared_ptr<MountTable> table) : table_(std::move(table)) {}

  std::unique_ptr<Session> openSession() override {
    auto table = table_->current();
    return table ? std::make_unique<MountTableSession>(std::move(table)) : nullptr;
  }

 private:
  const std::shared_ptr<MountTable> table_;
};

}  // namespace

std::unique_ptr<DiskArbitration> makeDiskArbitration(std::shared_ptr<MountTable> table) {
  return std::make_unique<MountTableArbitration>(std::move(table));
}

}  // namespace Varnel::Platform::Linux
