// SPDX-License-Identifier: MIT
#include <orvane/ManagedContentAccess.h>

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>

namespace Orvane::Testing {
namespace {

using namespace Varnel::Platform;

/// One volume, and a share whose files are looked up for as long as the test says.
class HangingCatalog final : public VolumeCatalog {
 public:
  Basalt::Semaphore isHanging, goOn;

  std::vector<MountedVolume> mountedVolumes() override { return {}; }
  Result<std::optional<URL>> volumeURL(const URL& url) override {
    if (url.path().starts_with("/share/")) {
      isHanging.signal();
      goOn.wait();
    }
    return std::optional(URL::fileURLWithPath("/"));
  }
  std::optional<std::string> volumeName(const URL&) override { return std::nullopt; }
  std::unique_ptr<Subscription> subscribe(ChangeHandler) override { return nullptr; }
};

TEST(ManagedContentAccess, AShareThatHangsHoldsUpNoReaderOfOtherDisks) {
  HangingCatalog volumes;
  Varnel::Platform::Testing::FakeDeviceRegistry devices;
  Varnel::Platform::Testing::FakeDiskArbitration disks;
  Varnel::Platform::Testing::FakeSecurityScope scope;
  Basalt::NotificationCenter center;
  Varnel::DiskAccessManager manager({devices, disks, volumes, scope, center});
  ManagedContentAccess access({manager, volumes}, QualityOfService::utility);
  Basalt::Semaphore isRead;
  const auto read = [&](const char* path, std::uint64_t device) {
    return std::thread([&, path, device] {
      EXPECT_TRUE(access.whileAccessing(path, device, [&] { isRead.signal(); }));
    });
  };
  std::thread onShare = read("/share/file", 1);
  volumes.isHanging.wait();
  std::thread onDisk = read("/home/file", 2);
  EXPECT_TRUE(
      isRead.waitUntil(std::chrono::floor<Date::duration>(std::chrono::system_clock::now()) +
                       std::chrono::seconds(20)));
  volumes.goOn.signal();
  onShare.join();
  onDisk.join();
}

}  // namespace
}  // namespace Orvane::Testing
