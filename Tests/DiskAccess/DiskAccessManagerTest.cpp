// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <atomic>
#include <latch>
#include <random>
#include <thread>
#include <vector>

#include <Tests/DiskAccess/DiskAccessFixture.h>
#include <Tests/Support/Crew.h>

namespace Varnel {
namespace {

using namespace Tests;

using DiskAccessManagerTest = DiskAccessFixture;

TEST_F(DiskAccessManagerTest, TheRelayTellsWhichVolumeCameOrWent) {
  std::vector<std::string> told;
  std::vector<Basalt::NotificationCenter::Observer> observers;
  for (const char* name : {"NSWorkspaceDidMountNotification", "NSWorkspaceDidUnmountNotification"})
    observers.push_back(center_.addObserver(name, [&](const Basalt::Notification& notification) {
      told.push_back(
          notification.name + ' ' +
          *Platform::findAs<std::string>(notification.userInfo, "NSWorkspaceVolumeURLKey"));
    }));
  volumes_.mount(plain(stickVolume));
  volumes_.unmount(stickVolume);
  EXPECT_EQ(told, (std::vector<std::string>{"NSWorkspaceDidMountNotification file:///stick/",
                                            "NSWorkspaceDidUnmountNotification file:///stick/"}));
}

TEST_F(DiskAccessManagerTest, AMountThatAppearsWhileThreadsWaitGetsItsOwnDisk) {
  const auto useUnknownDisk = [&](const URL& volume) {
    return manager_->beginAccessingURL(stickFile, "test", QoS::utility, false, {}, volume);
  };
  const Session holder = useUnknownDisk(archiveVolume);
  std::atomic<int> admitted = 0;
  Tests::Crew waiting(3, [&](unsigned) {
    const DiskAccessGuard access(useUnknownDisk(stickVolume));
    EXPECT_EQ(access->diskInfo()->uniqueID(), "unknown");
    ++admitted;
  });
  awaitRequests(*holder->diskData(), 3);
  plugDisk("HDD-1", "sda1", "Rotational", stickVolume);
  mount(stickVolume);
  begin(stickFile)->endAccessing();
  const Session known = begin(stickFile);
  EXPECT_EQ(known->diskInfo()->uniqueID(), "HDD-1");
  EXPECT_EQ(admitted, 0) << "an inventory leaves the lines as they are";
  holder->endAccessing();
  waiting.join();
  EXPECT_EQ(admitted, 3);
  known->endAccessing();
}

TEST_F(DiskAccessManagerTest, ADiskThatGoesIsRememberedForAThreadThatIsBeingWoken) {
  mountStick();
  Session holder = begin(stickFile);
  DiskData& disk = *holder->diskData();
  Session woken;
  std::thread waiting([&] { woken = beginOnKnownDisk(stickFile); });
  awaitRequests(disk, 1);
  disk.queue().sync([&] {
    // The inventory stands in line before the thread is woken, which then confirms behind it.
    volumes_.unmount(stickVolume);
    disk.releaseAccess(Basalt::currentThreadID());
    disk.grantPendingRequests();
    holder.reset();
  });
  waiting.join();
  ASSERT_TRUE(woken);
  mountStick();
  EXPECT_EQ(accessCount(*woken->diskData()), 1u);
  std::thread([&] { EXPECT_FALSE(begin(stickFile, 0)) << "its only place is taken"; }).join();
}

TEST_F(DiskAccessManagerTest, AStormOfMountsCostsOneInventoryAndLosesNone) {
  Basalt::SerialQueue& queue = DiskAccessGuard(begin(homeFile))->diskData()->queue();
  int inventories = 0;
  queue.sync([&] {
    inventories = disks_.openedSessions();
    for (int i = 0; i < 500; ++i)
      center_.post({.name = std::string(didMountNotification), .userInfo = {}});
    registry_.interruption = [&] {
      plugDisk("HDD-1", "sda1", "Rotational", stickVolume);
      volumes_.mount(plain(stickVolume));
    };
  });
  awaitInventory();
  EXPECT_LE(disks_.openedSessions(), inventories + 3) << "one of one disk, and one of two";
  awaitInventory();
  EXPECT_EQ(DiskAccessGuard(begin(stickFile))->diskInfo()->uniqueID(), "HDD-1");
}

TEST_F(DiskAccessManagerTest, AVolumeOverTwoDisksBelongsToTheLast) {
  plugDisk("HDD-2", "sdb", "Rotational", homeVolume);
  center_.post({.name = std::string(didMountNotification), .userInfo = {}});
  awaitInventory();
  EXPECT_EQ(DiskAccessGuard(begin(homeFile))->diskInfo()->uniqueID(), "HDD-2");
}

TEST_F(DiskAccessManagerTest, AnInventedIdentifierLastsAsLongAsItsVolumeStaysMounted) {
  const auto identifier = [&](const URL& volume) {
    return *DiskAccessGuard(
                manager_->beginAccessingURL(volume, "test", QoS::utility, false, {}, volume))
                ->diskInfo()
                ->uniqueID();
  };
  mount(archiveVolume);
  const std::string invented = identifier(archiveVolume);
  {
    const DiskAccessGuard onlyPlace(begin(archiveVolume));
    mount(stickVolume);
    EXPECT_EQ(identifier(archiveVolume), invented);
    EXPECT_NE(identifier(stickVolume), invented);
    std::thread([&] { EXPECT_FALSE(begin(archiveVolume, 0)) << "it is the same disk"; }).join();
  }
  // Another volume comes to the place of the first before an inventory has missed that one.
  DiskAccessGuard(begin(homeFile))->diskData()->queue().sync([&] {
    volumes_.unmount(archiveVolume);
    volumes_.mount(plain(archiveVolume));
  });
  awaitInventory();
  EXPECT_NE(identifier(archiveVolume), invented);
}

TEST_F(DiskAccessManagerTest, BackgroundModeOffWakesWaitersAndOnWakesNobody) {
  const Session holder = begin(homeFile);
  manager_->setIsBackgroundMode(true);
  EXPECT_TRUE(manager_->isBackgroundMode());
  awaitInventory();
  std::latch admitted(3);
  Tests::Crew waiting(3, [&](unsigned) {
    const DiskAccessGuard access(beginOnKnownDisk(homeFile));
    admitted.count_down();
  });
  awaitRequests(*holder->diskData(), 3);
  manager_->setIsBackgroundMode(true);
  awaitInventory();
  awaitRequests(*holder->diskData(), 3);
  EXPECT_FALSE(admitted.try_wait());
  manager_->setIsBackgroundMode(false);
  admitted.wait();
  holder->endAccessing();
  waiting.join();

  // A disk that comes in background mode starts in it.
  manager_->setIsBackgroundMode(true);
  plugDisk("SSD-2", "nvme1n1", "Solid State", stickVolume);
  mount(stickVolume);
  const DiskAccessGuard access(begin(stickFile));
  std::thread([&] { EXPECT_FALSE(begin(stickFile, 0)); }).join();
}

// Readers of all classes, with time-outs around the time that a place takes to come free, while the
// mode and the mounts change: everybody comes in or gives up, and every place comes back.
TEST_F(DiskAccessManagerTest, LosesNoPlaceUnderStress) {
  constexpr QoS classes[] = {QoS::background, QoS::utility, QoS::default_, QoS::userInteractive};
  std::atomic<int> readers = 4;
  Tests::Crew threads(4, [&](unsigned thread) {
    std::minstd_rand random(thread + 1);
    for (int i = 0; i < 3000; ++i) {
      const unsigned choice = static_cast<unsigned>(random());
      std::optional<double> timeout;
      if (choice % 4 != 0) timeout = 1e-6 * (choice / 4 % 100);
      const DiskAccessGuard access(begin(homeFile, timeout, classes[thread]));
      if (!access) continue;
      const DiskAccessGuard nested(choice % 7 == 0 ? begin(homeFile, 0) : nullptr);
      if (choice % 3 == 0) std::this_thread::yield();
    }
    --readers;
  });
  for (bool isBackgroundMode = true; readers > 0; isBackgroundMode = !isBackgroundMode) {
    manager_->setIsBackgroundMode(isBackgroundMode);
    center_.post({.name = std::string(didUnmountNotification), .userInfo = {}});
    awaitInventory();
  }
  threads.join();
  const Session last = begin(homeFile);
  ASSERT_EQ(last->diskInfo()->uniqueID(), "SSD-1");
  EXPECT_EQ(accessCount(*last->diskData()), 1u);
  last->endAccessing();
}

TEST_F(DiskAccessManagerTest, MayGoWhileSessionsAreLeft) {
  const Session left = begin(homeFile);
  volumes_.announce({.kind = Platform::VolumeChange::Kind::mounted, .volumeURL = stickVolume});
  manager_.reset();
  volumes_.announce({.kind = Platform::VolumeChange::Kind::mounted, .volumeURL = stickVolume});
  left->endAccessing();
  EXPECT_EQ(accessCount(*left->diskData()), 0u);

  // On the planning queue itself it leaves an inventory behind, for which nothing is there any
  // more.
  manager_.emplace(DiskAccessManager::Ports{devices_, disks_, volumes_, scope_, center_});
  awaitInventory();
  // The record keeps the queue.
  const std::shared_ptr<DiskData> disk = DiskAccessGuard(begin(homeFile))->diskData();
  Basalt::SerialQueue& queue = disk->queue();
  const int inventories = disks_.openedSessions();
  queue.sync([&] {
    center_.post({.name = std::string(didMountNotification), .userInfo = {}});
    manager_.reset();
  });
  queue.sync([] {});
  EXPECT_EQ(disks_.openedSessions(), inventories);
}

}  // namespace
}  // namespace Varnel
