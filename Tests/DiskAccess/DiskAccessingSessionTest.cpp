// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

#include <Tests/DiskAccess/DiskAccessFixture.h>
#include <Tests/Support/Crew.h>
#include <Varnel/DiskAccess/ManagedAccess.h>

namespace Varnel {
namespace {

using namespace Tests;

using DiskAccessingSessionTest = DiskAccessFixture;

TEST_F(DiskAccessingSessionTest, OpensASecurityScopeOnlyWhenAskedAndOnAVolume) {
  EXPECT_FALSE(begin(stickFile)) << "it lies on no volume";
  volumes_.setLookupError(Platform::PlatformError("Test", 1));
  EXPECT_FALSE(begin(homeFile));
  volumes_.setLookupError({});
  const int before = scope_.startCount();
  const Session scoped = begin(homeFile);
  EXPECT_EQ(scope_.startCount(), before + 1);
  manager_->beginAccessingURL(homeFile, "test", QoS::utility, false)->endAccessing();
  EXPECT_EQ(scope_.startCount(), before + 1);
  EXPECT_EQ(scope_.openAccesses(homeFile), 1) << "the other one is not its to close";
  scoped->endAccessing();
  EXPECT_EQ(scope_.openAccesses(homeFile), 0);

  const URL secret = URL::fileURLWithPath("/home/secret");
  scope_.forbid(secret);
  EXPECT_FALSE(begin(secret));
  DiskAccessGuard access(begin(homeFile));
  EXPECT_EQ(accessCount(*access->diskData()), 1u);
}

// A fault may refuse an access. No place, scope or handle stays taken, and later ones are granted.
TEST(DiskAccessFaults, RefuseAnAccessAndKeepNothing) {
  struct Machine final : DiskAccessFixture {
    void TestBody() override {}

    void play(const std::shared_ptr<Platform::Testing::FaultPlan>& faults) {
      setFaults(faults);
      mountStick();
      for (const URL& file : {homeFile, stickFile})
        for (int access = 0; access < 2; ++access)
          if (const Session session = begin(file)) session->endAccessing();
      faults->mend();
      unmount(stickVolume);
      mountStick();
      for (const URL& file : {homeFile, stickFile}) {
        const DiskAccessGuard access(beginOnKnownDisk(file));
        EXPECT_TRUE(access) << file.path();
        EXPECT_EQ(accessCount(*access->diskData()), 1u);
        EXPECT_EQ(scope_.openAccesses(file), 1);
      }
      EXPECT_EQ(scope_.openAccesses(homeFile) + scope_.openAccesses(stickFile), 0);
      EXPECT_EQ(devices_.liveEntries() + disks_.liveSessions(), 0);
    }
  };
  for (const auto fault : {Platform::Testing::Fault::fails, Platform::Testing::Fault::absent})
    EXPECT_GE(sweepFaults(fault, [](const auto& faults) { Machine().play(faults); }), 10u);
}

TEST_F(DiskAccessingSessionTest, ASessionThatIsDroppedKeepsItsPlaceAndItsScope) {
  mountStick();
  std::shared_ptr<DiskData> disk;
  std::thread([&] { disk = begin(stickFile)->diskData(); }).join();
  EXPECT_EQ(accessCount(*disk), 1u);
  EXPECT_EQ(scope_.openAccesses(stickFile), 1);
  for (const double timeout : {0.0, -1.0, 0.001}) EXPECT_FALSE(begin(stickFile, timeout));
  EXPECT_EQ(scope_.openAccesses(stickFile), 4) << "a time-out leaves its scope open";

  unmount(stickVolume);
  const Session gone =
      manager_->beginAccessingURL(stickFile, "test", QoS::utility, false, 0, stickVolume);
  ASSERT_TRUE(gone);
  EXPECT_EQ(gone->diskInfo()->uniqueID(), "unknown");
  gone->endAccessing();
  mountStick();
  EXPECT_FALSE(begin(stickFile, 0)) << "the place is still taken when the disk returns";
}

TEST_F(DiskAccessingSessionTest, SessionsOfOneThreadNestAndCountEach) {
  mountStick();
  const Session outer = begin(stickFile);
  const Session inner = begin(stickFile);
  outer->endAccessing();
  EXPECT_EQ(accessCount(*inner->diskData()), 1u);
  std::thread([&] { EXPECT_FALSE(begin(stickFile, 0)); }).join();
  inner->endAccessing();

  const Session one = begin(stickFile);
  const Session other = begin(stickFile);
  one->endAccessing();
  one->endAccessing();
  EXPECT_FALSE(one->isAccessing());
  EXPECT_EQ(accessCount(*other->diskData()), 0u) << "each end takes a place of the thread back";
  std::thread([&] { EXPECT_TRUE(begin(stickFile)); }).join();
}

TEST_F(DiskAccessingSessionTest, PassesOnWhatACallerAsksFor) {
  const auto beginAs = [&](QoS qos) {
    return manager_->beginAccessingURL(homeFile, "test", qos, false, {}, archiveVolume);
  };
  const DiskAccessGuard holder(beginAs(QoS::utility));
  EXPECT_EQ(classOfWaiter(*holder->diskData(), [&] { return beginAs(QoS::userInteractive); }), 0);
  EXPECT_EQ(classOfWaiter(*holder->diskData(), [&] { return beginAs(QoS::background); }), 3);

  const URL folder = URL::fileURLWithPath("/");
  const URL noVolume = URL::fileURLWithPath("/no volume/");
  const DiskAccessGuard managed(beginManagedAccessing(folder, "purpose", true, {}, noVolume));
  ASSERT_TRUE(managed);
  EXPECT_EQ(managed->url(), folder);
  EXPECT_EQ(managed->propose(), "purpose");
  EXPECT_TRUE(managed->secureScope());
  EXPECT_EQ(managed->diskInfo()->uniqueID(), "unknown");
  EXPECT_EQ(DiskAccessGuard(DiskAccessManager::shared().beginAccessingURL(folder, "", QoS::utility,
                                                                          false, {}, noVolume))
                ->diskData(),
            managed->diskData());
  EXPECT_EQ(classOfWaiter(*managed->diskData(),
                          [&] {
                            Session session =
                                beginManagedAccessing(folder, "", false, {}, noVolume);
                            EXPECT_FALSE(session->secureScope());
                            return session;
                          }),
            2);
  std::thread([&] { EXPECT_FALSE(beginManagedAccessing(folder, "", false, 0, noVolume)); }).join();
}

TEST_F(DiskAccessingSessionTest, AThreadThatHoldsADiskUsesItWhateverTheLookUpFinds) {
  manager_->setIsBackgroundMode(true);
  disks_.setMountURLs("nvme0n1", {homeVolume, archiveVolume});
  mount(archiveVolume);
  const auto diskOf = [](const Session& session) {
    return session ? session->diskInfo()->uniqueID().value() : "none";
  };
  EXPECT_EQ(diskOf(beginOnBusyQueue(homeVolume)), "unknown")
      << "it held nothing, and holds this now";
  std::thread([&] {
    begin(homeFile)->endAccessing();
    const Session outer = begin(homeFile);
    const Session inner = beginOnBusyQueue(homeVolume, 0);
    ASSERT_EQ(diskOf(inner), "SSD-1");
    EXPECT_EQ(diskOf(beginOnBusyQueue(archiveVolume, 0)), "SSD-1") << "a volume of the same disk";
    volumes_.unmount(archiveVolume);
    outer->endAccessing();
    inner->endAccessing();
    EXPECT_EQ(diskOf(beginOnBusyQueue(archiveVolume, 0)), "SSD-1") << "the dropped one is left";
  }).join();
  EXPECT_EQ(diskOf(begin(homeFile, 0)), "unknown") << "this disk is full, but that place is held";
  mount(archiveVolume);
  EXPECT_EQ(diskOf(begin(URL::fileURLWithPath("/archive/file"), 0)), "unknown")
      << "it stands for the disk's other volumes too";
}

// Threads that nest sessions without a time-out while the planning queue is busy: all come through.
TEST_F(DiskAccessingSessionTest, NestedSessionsNeverWaitForOneAnother) {
  plugDisk("HDD-1", "sda1", "Rotational", stickVolume);
  manager_->setIsBackgroundMode(true);
  mount(stickVolume);
  const auto unknown = beginOnBusyQueue(homeVolume);
  unknown->endAccessing();
  const struct {
    const URL& file;
    bool isBackgroundMode;
    unsigned threads;
  } cases[] = {{homeFile, true, 2}, {stickFile, false, 4}};
  for (const auto& each : cases) {
    manager_->setIsBackgroundMode(each.isBackgroundMode);
    awaitInventory();
    const std::shared_ptr<DiskData> disk = DiskAccessGuard(begin(each.file))->diskData();
    ASSERT_NE(disk, unknown->diskData()) << "an access that is over binds nobody";
    std::atomic<unsigned> left = each.threads;
    Tests::Crew threads(each.threads, [&](unsigned) {
      for (int i = 0; i < 5000; ++i) {
        const DiskAccessGuard outer(begin(each.file));
        std::this_thread::yield();
        const DiskAccessGuard inner(begin(each.file));
      }
      --left;
    });
    std::thread([&] {
      while (left > 0) disk->queue().sync([] { std::this_thread::yield(); });
    }).join();
    threads.join();
    EXPECT_EQ(accessCount(*disk) + accessCount(*unknown->diskData()), 0u);
  }
}

TEST_F(DiskAccessingSessionTest, AGrantThatRacesATimeOutAdmitsTheThreadOnce) {
  manager_->setIsBackgroundMode(true);
  awaitInventory();
  const std::shared_ptr<DiskData> disk = begin(homeFile)->diskData();
  // Where the machine is so busy that the time is up before the grant, more time is given.
  bool isAdmitted = false;
  for (double timeout = 0.02; !isAdmitted; timeout *= 2) {
    std::thread waiting([&] {
      const Session session = beginOnKnownDisk(homeFile, timeout);
      if (!session) return;
      isAdmitted = true;
      EXPECT_EQ(accessCount(*disk), 1u);
      session->endAccessing();
    });
    awaitRequests(*disk, 1);
    disk->queue().sync([&] {
      // The wake-up is held back until the thread's time is up, although its place is granted.
      disk->releaseAccess(Basalt::currentThreadID());
      disk->grantPendingRequests();
      std::this_thread::sleep_for(std::chrono::duration<double>(timeout * 1.5));
    });
    waiting.join();
    EXPECT_EQ(accessCount(*disk), 0u);
    if (!isAdmitted) disk->queue().sync([&] { disk->confirmAccess(Basalt::currentThreadID()); });
  }
}

}  // namespace
}  // namespace Varnel
