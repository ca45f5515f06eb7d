// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
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

/// A task of some turns that tells when it is done.
class Turns final : public DiskTask {
 public:
  Turns(int count, Basalt::Semaphore& isDone) : left_(count), isDone_(isDone) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    while (!turn.isOver()) turn.didRead(1 << 20);
    if (--left_ > 0) return 0;
    isDone_.signal();
    return std::nullopt;
  }
  void refuse() override { ADD_FAILURE(); }

 private:
  int left_;
  Basalt::Semaphore& isDone_;
};

TEST(ManagedDiskTurns, AShareThatHangsHoldsUpNoReaderOfOtherDisks) {
  HangingCatalog volumes;
  Varnel::Platform::Testing::FakeDeviceRegistry devices;
  Varnel::Platform::Testing::FakeDiskArbitration disks;
  Varnel::Platform::Testing::FakeSecurityScope scope;
  Basalt::NotificationCenter center;
  Varnel::DiskAccessManager manager({devices, disks, volumes, scope, center});
  Varnel::DiskReadingQueue queue(manager);
  ManagedDiskTurns turns({queue, volumes}, QualityOfService::utility, 2);
  Basalt::Semaphore isDone;
  const auto read = [&](const char* path) {
    return std::thread(
        [&, path] { turns.start(turns.diskOf(path), std::make_shared<Turns>(3, isDone)); });
  };
  const auto isDoneInTime = [&] {
    return isDone.waitUntil(std::chrono::floor<Date::duration>(std::chrono::system_clock::now()) +
                            std::chrono::seconds(20));
  };
  std::thread onShare = read("/share/file");
  volumes.isHanging.wait();
  std::thread onDisk = read("/home/file");
  EXPECT_TRUE(isDoneInTime());
  volumes.goOn.signal();
  onShare.join();
  onDisk.join();
  EXPECT_TRUE(isDoneInTime());
}

}  // namespace
}  // namespace Orvane::Testing
