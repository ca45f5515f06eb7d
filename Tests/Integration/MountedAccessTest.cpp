// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <filesystem>

#include <Tests/Support/DiskImage.h>
#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Basalt/NotificationCenter.h>
#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>

namespace Varnel {
namespace {

using Platform::URL;

// The system's own services from end to end: nobody tells the manager of the mount.
TEST(MountedAccess, ADiskIsKnownOnceItIsMounted) {
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
  Basalt::Semaphore mounted;
  const auto observer = Basalt::NotificationCenter::defaultCenter().addObserver(
      std::string(didMountNotification), [&](const Basalt::Notification&) { mounted.signal(); });

  ASSERT_TRUE(image.mount(place));
  mounted.wait();
  // The first access comes after the inventory, which may still have kept the queue from answering.
  begin()->endAccessing();
  {
    const DiskAccessGuard access(begin());
    EXPECT_EQ(access->diskInfo()->kind(), OVDiskKindExternal);
    EXPECT_EQ(access->diskInfo()->volumeURLs(), OVDiskInfo::VolumeURLs{volume});
  }
  EXPECT_EQ(::umount(place.c_str()), 0);
}

}  // namespace
}  // namespace Varnel
