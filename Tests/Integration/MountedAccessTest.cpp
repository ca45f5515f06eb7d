// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <atomic>
#include <filesystem>
#include <thread>
#include <vector>

#include <Tests/Support/DiskImage.h>
#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Basalt/NotificationCenter.h>
#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>

namespace Varnel {
namespace {

using Platform::URL;

// The system's own services from end to end: nobody tells the manager of the mount.
TEST(MountedAccess, ADiskThatIsMountedWhileThreadsWaitIsKnownAtOnce) {
  // Once a process, as the process's services stay in the namespace in which they began.
  static const std::string reason = Tests::enterMountNamespace();
  if (!reason.empty()) GTEST_SKIP() << reason;
  const Tests::TemporaryFolder folder;
  const Tests::DiskImage image(folder.path() / "image");
  if (image.name().empty()) GTEST_SKIP() << "no mkfs.ext4 or no loop devices";
  const auto place = folder.path() / "place";
  std::filesystem::create_directory(place);
  const URL volume = URL::fileURLWithPath(place.string() + "/");

  DiskAccessManager manager;
  const auto begin = [&] { return manager.beginAccessingURL(volume, "test"); };
  const auto beginOn = [&](const URL& told) {
    return manager.beginAccessingURL(volume, "test", Platform::QualityOfService::utility, false, {},
                                     told);
  };
  Basalt::Semaphore mounted;
  const auto observer = Basalt::NotificationCenter::defaultCenter().addObserver(
      std::string(didMountNotification), [&](const Basalt::Notification&) { mounted.signal(); });

  const auto holder = beginOn(URL::fileURLWithPath("/no volume/"));
  ASSERT_EQ(holder->diskInfo()->uniqueID(), "unknown");
  std::atomic<int> admitted = 0;
  std::vector<std::thread> waiting;
  for (int i = 0; i < 3; ++i) {
    waiting.emplace_back([&] {
      const DiskAccessGuard access(beginOn(volume));
      ++admitted;
    });
  }
  DiskData& unknown = *holder->diskData();
  while (unknown.queue().sync([&] { return unknown.requestCount(); }) < 3)
    std::this_thread::yield();

  ASSERT_TRUE(image.mount(place));
  mounted.wait();
  // The first access comes after the inventory, which may still have kept the queue from answering.
  begin()->endAccessing();
  {
    const DiskAccessGuard access(begin());
    EXPECT_EQ(access->diskInfo()->kind(), OVDiskKindExternal);
    EXPECT_EQ(access->diskInfo()->volumeURLs(), OVDiskInfo::VolumeURLs{volume});
  }
  EXPECT_EQ(admitted, 0);
  holder->endAccessing();
  for (std::thread& thread : waiting) thread.join();
  EXPECT_EQ(admitted, 3);
  EXPECT_EQ(::umount(place.c_str()), 0);
}

}  // namespace
}  // namespace Varnel
