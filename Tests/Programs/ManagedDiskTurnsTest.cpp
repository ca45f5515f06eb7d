// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

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

/// A task that loses a volume in each of its turns.
class LosingTask final : public DiskTask {
 public:
  LosingTask(std::vector<const char*> volumes, Basalt::NotificationCenter& center,
             Basalt::Semaphore& isRefused)
      : volumes_(std::move(volumes)), center_(center), isRefused_(isRefused) {}

  std::optional<std::uint64_t> run(DiskTurn&) override {
    if (turns == volumes_.size()) return std::nullopt;
    center_.post({.name = std::string(Varnel::didUnmountNotification),
                  .userInfo = {{std::string(Varnel::volumeURLKey),
                                URL::fileURLWithPath(volumes_[turns++]).absoluteString()}}});
    return 0;
  }
  void refuse() override { isRefused_.signal(); }

  std::size_t turns = 0;

 private:
  const std::vector<const char*> volumes_;
  Basalt::NotificationCenter& center_;
  Basalt::Semaphore& isRefused_;
};

TEST(ManagedDiskTurns, AnUnmountedVolumeTakesNoOtherOfItsDiskAlong) {
  namespace Fakes = Varnel::Platform::Testing;
  Fakes::FakeVolumeCatalog volumes;
  Fakes::FakeDeviceRegistry devices;
  Fakes::FakeDiskArbitration disks;
  Fakes::FakeSecurityScope scope;
  Basalt::NotificationCenter center;
  std::vector<MountedVolume> mounted;
  for (const char* path : {"/home/", "/archive/", "/attic/"})
    mounted.push_back(
        {.url = URL::fileURLWithPath(path), .isLocal = {}, .isInternal = {}, .uuid = {}});
  volumes.setVolumes(mounted);
  const auto device = devices.plug(
      {{"SMART Capable", true},
       {"Device Characteristics", PropertyDictionary{{"Serial Number", std::string("SSD-1")}}}});
  devices.plug({{"BSD Name", std::string("nvme0n1")}}, device);
  disks.setMountURLs("nvme0n1", {mounted[0].url, mounted[1].url, mounted[2].url});
  Varnel::DiskAccessManager manager({devices, disks, volumes, scope, center});
  Varnel::DiskReadingQueue queue(manager);
  ManagedDiskTurns turns({queue, volumes}, QualityOfService::utility, 2);
  const ScanDisk& disk = turns.diskOf("/home/file");
  for (const char* path : {"/archive/file", "/attic/file", "/home/other"})
    ASSERT_EQ(&turns.diskOf(path), &disk);
  Basalt::Semaphore isRefused;
  const auto task = std::make_shared<LosingTask>(std::vector{"/home/", "/archive/", "/attic/"},
                                                 center, isRefused);
  turns.start(disk, task);
  isRefused.wait();
  EXPECT_EQ(task->turns, 3u) << "as long as a volume of the disk is there";
}

}  // namespace
}  // namespace Orvane::Testing
