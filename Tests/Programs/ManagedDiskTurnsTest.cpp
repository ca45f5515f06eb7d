// SPDX-License-Identifier: MIT
#include <orvane/ManagedDiskTurns.h>

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Orvane::Testing {
namespace {

using namespace Varnel::Platform;

MountedVolume volume(const URL& url) {
  return {.url = url, .isLocal = {}, .isInternal = {}, .uuid = {}};
}

/// A machine with one disk of three volumes, and a share.
class ManagedDiskTurnsTest : public ::testing::Test {
 protected:
  const std::vector<URL> urls = {URL::fileURLWithPath("/home/"), URL::fileURLWithPath("/archive/"),
                                 URL::fileURLWithPath("/attic/")};
  Varnel::Platform::Testing::FakePorts fakes;
  Varnel::Platform::Testing::FakeVolumeCatalog& volumes = plugged(fakes).volumeCatalog;
  Varnel::DiskAccessManager manager{fakes.ports()};
  Varnel::DiskReadingQueue queue{manager};
  ManagedDiskTurns turns{{queue, volumes}, QualityOfService::utility, 2};

 private:
  Varnel::Platform::Testing::FakePorts& plugged(Varnel::Platform::Testing::FakePorts& machine) {
    const auto device = machine.deviceRegistry.plug(
        {{"SMART Capable", true},
         {"Device Characteristics", PropertyDictionary{{"Serial Number", std::string("SSD-1")}}}});
    machine.deviceRegistry.plug({{"BSD Name", std::string("nvme0n1")}}, device);
    machine.diskArbitration.setMountURLs("nvme0n1", urls);
    for (const URL& url : urls) machine.volumeCatalog.mount(volume(url));
    machine.volumeCatalog.mount(volume(URL::fileURLWithPath("/share/")));
    return machine;
  }
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

TEST_F(ManagedDiskTurnsTest, AShareThatHangsHoldsUpNoReaderOfOtherDisks) {
  Basalt::Semaphore isDone;
  const auto read = [&](const char* path) {
    return std::thread(
        [&, path] { turns.start(turns.diskOf(path), std::make_shared<Turns>(3, isDone)); });
  };
  const auto isDoneInTime = [&] {
    return isDone.waitUntil(std::chrono::floor<Date::duration>(std::chrono::system_clock::now()) +
                            std::chrono::seconds(20));
  };
  (void)turns.diskOf("/home/file");  // The first inventory is over; the next look-up hangs.
  const std::size_t next = volumes.faults->calls() + 1;
  volumes.faults->plan(Varnel::Platform::Testing::Fault::delays, next, 1);
  std::thread onShare = read("/share/file");
  volumes.faults->waitForCalls(next);
  std::thread onDisk = read("/home/file");
  EXPECT_TRUE(isDoneInTime());
  volumes.faults->mend();
  onShare.join();
  onDisk.join();
  EXPECT_TRUE(isDoneInTime());
}

TEST_F(ManagedDiskTurnsTest, KnowsWhatIsMountedWithoutALookAtIt) {
  using enum ScanMount::Kind;
  volumes.mount({.url = URL::fileURLWithPath("/nas/"), .isLocal = false});
  volumes.setPseudoFileSystems({URL::fileURLWithPath("/proc/")});
  volumes.setLookupError(PlatformError("Test", 1));
  std::map<std::string, ScanMount::Kind> kinds;
  for (const ScanMount& mount : turns.mounts()) {
    kinds[mount.path] = mount.kind;
    EXPECT_EQ(turns.diskOf(mount.path).isReadable, mount.kind != pseudo) << mount.path;
  }
  EXPECT_EQ(kinds, (std::map<std::string, ScanMount::Kind>{{"/home", local},
                                                           {"/archive", local},
                                                           {"/attic", local},
                                                           {"/share", local},
                                                           {"/nas", network},
                                                           {"/proc", pseudo}}));
  EXPECT_FALSE(turns.diskOf("/nas/file").isReadable) << "that needs a look-up";
}

/// A task that loses a volume in each of its turns.
class LosingTask final : public DiskTask {
 public:
  LosingTask(std::vector<URL> volumes, Varnel::Platform::Testing::FakeVolumeCatalog& catalog,
             Basalt::Semaphore& isRefused)
      : volumes_(std::move(volumes)), catalog_(catalog), isRefused_(isRefused) {}

  std::optional<std::uint64_t> run(DiskTurn&) override {
    if (turns == volumes_.size()) return std::nullopt;
    catalog_.announce({.kind = VolumeChange::Kind::unmounted, .volumeURL = volumes_[turns++]});
    return 0;
  }
  void refuse() override { isRefused_.signal(); }

  std::size_t turns = 0;

 private:
  const std::vector<URL> volumes_;
  Varnel::Platform::Testing::FakeVolumeCatalog& catalog_;
  Basalt::Semaphore& isRefused_;
};

TEST_F(ManagedDiskTurnsTest, AnUnmountedVolumeTakesNoOtherOfItsDiskAlong) {
  const ScanDisk& disk = turns.diskOf("/home/file");
  for (const char* path : {"/archive/file", "/attic/file", "/home/other"})
    ASSERT_EQ(&turns.diskOf(path), &disk);
  Basalt::Semaphore isRefused;
  const auto task = std::make_shared<LosingTask>(urls, volumes, isRefused);
  turns.start(disk, task);
  isRefused.wait();
  EXPECT_EQ(task->turns, 3u) << "as long as a volume of the disk is there";
}

}  // namespace
}  // namespace Orvane::Testing
