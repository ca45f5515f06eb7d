// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskAccessManager.h>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <latch>
#include <random>
#include <thread>
#include <vector>

#include <Tests/Support/Crew.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/ManagedAccess.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel {
namespace {

using Platform::URL;
using QoS = Platform::QualityOfService;
using Session = std::unique_ptr<DiskAccessingSession>;

const URL homeVolume = URL::fileURLWithPath("/home/");
const URL archiveVolume = URL::fileURLWithPath("/archive/");
const URL stickVolume = URL::fileURLWithPath("/stick/");
const URL homeFile = URL::fileURLWithPath("/home/file");
const URL stickFile = URL::fileURLWithPath("/stick/file");

/// A registry that does something in the middle of an inventory, once.
class InterruptedRegistry final : public Platform::DeviceRegistry {
 public:
  explicit InterruptedRegistry(Platform::DeviceRegistry& devices) : devices_(devices) {}

  std::function<void()> interruption;  ///< To be set on the queue that takes the inventory.

  std::optional<Entries> entriesMatchingProperty(std::string_view name,
                                                 const Platform::PropertyValue& value) override {
    auto entries = devices_.entriesMatchingProperty(name, value);
    if (auto interrupt = std::exchange(interruption, {})) interrupt();
    return entries;
  }

 private:
  Platform::DeviceRegistry& devices_;
};

/// A machine with a solid-state disk under /home/, and a manager that knows it.
class DiskAccessManagerTest : public ::testing::Test {
 protected:
  DiskAccessManagerTest() {
    plugDisk("SSD-1", "nvme0n1", "Solid State", homeVolume);
    volumes_.setVolumes({{.url = homeVolume, .isLocal = {}, .isInternal = {}, .uuid = {}}});
    manager_.emplace(DiskAccessManager::Ports{.devices = registry_,
                                              .disks = disks_,
                                              .volumes = volumes_,
                                              .securityScope = scope_,
                                              .notificationCenter = center_});
    awaitInventory();
  }

  void plugDisk(const char* serial, const char* name, const char* medium, const URL& volume) {
    const auto device = devices_.plug(
        {{"SMART Capable", true},
         {"Device Characteristics",
          Platform::PropertyDictionary{{"Serial Number", serial}, {"Medium Type", medium}}}});
    devices_.plug({{"BSD Name", name}}, device);
    disks_.setMountURLs(name, {volume});
  }

  /// The inventories that this thread has asked for precede its next access.
  void awaitInventory() {
    if (const auto session = begin(homeFile)) session->endAccessing();
  }

  void mount(const Platform::MountedVolume& volume) {
    volumes_.mount(volume);
    awaitInventory();
  }
  void mount(const URL& volume) {
    mount({.url = volume, .isLocal = {}, .isInternal = {}, .uuid = {}});
  }
  void mountStick() {
    mount({.url = stickVolume, .isLocal = true, .isInternal = false, .uuid = "STICK"});
  }
  void unmount(const URL& volume) {
    volumes_.unmount(volume);
    awaitInventory();
  }

  Session begin(const URL& file, std::optional<double> timeout = {}, QoS qos = QoS::utility) {
    return manager_->beginAccessingURL(file, "test", qos, true, timeout);
  }

  /// The same while other threads keep the manager too busy to look the disk up.
  Session beginOnKnownDisk(const URL& file, std::optional<double> timeout = {}) {
    Session session = begin(file, timeout);
    while (session && session->diskInfo()->uniqueID() == "unknown") {
      session->endAccessing();
      session = begin(file, timeout);
    }
    return session;
  }

  /// The same for a volume while the planning queue is too busy to say which disk it lies on.
  Session beginOnBusyQueue(const URL& volume, std::optional<double> timeout = {}) {
    Basalt::SerialQueue& queue = DiskAccessGuard(begin(homeFile))->diskData()->queue();
    const int before = scope_.startCount();
    std::latch isBusy(1);
    std::thread keeper([&] {
      queue.sync([&] {
        isBusy.count_down();
        // A scope is opened between the look-up and the admission.
        while (scope_.startCount() == before) std::this_thread::yield();
      });
    });
    isBusy.wait();
    Session session =
        manager_->beginAccessingURL(volume, "test", QoS::utility, true, timeout, volume);
    keeper.join();
    return session;
  }

  static std::size_t accessCount(DiskData& disk) {
    return disk.queue().sync([&] { return disk.accessCount(); });
  }

  static void awaitRequests(DiskData& disk, std::size_t count) {
    while (disk.queue().sync([&] { return disk.requestCount(); }) < count)
      std::this_thread::yield();
  }

  /// The class in which a thread waits that begins an access to this full disk.
  static int classOfWaiter(DiskData& disk, const std::function<Session()>& begin) {
    std::thread waiting([&] { DiskAccessGuard access(begin()); });
    awaitRequests(disk, 1);
    const auto waiters = disk.queue().sync([&] { return disk.claimPendingRequests(); });
    for (const auto& request : waiters) request->sema.signal();
    waiting.join();
    return waiters.at(0)->urgencyClass();
  }

  Platform::Testing::FakeDeviceRegistry devices_;
  InterruptedRegistry registry_{devices_};
  Platform::Testing::FakeDiskArbitration disks_;
  Platform::Testing::FakeVolumeCatalog volumes_;
  Platform::Testing::FakeSecurityScope scope_;
  Basalt::NotificationCenter center_;
  const VolumeChangeRelay relay_{volumes_, center_};
  std::optional<DiskAccessManager> manager_;
};

TEST_F(DiskAccessManagerTest, CountsAnAccessAgainstTheDiskOfItsVolume) {
  const DiskAccessGuard known(begin(homeFile));
  EXPECT_EQ(known->diskInfo()->uniqueID(), "SSD-1");
  EXPECT_TRUE(known->isAccessing());
  const DiskAccessGuard told(
      manager_->beginAccessingURL(stickFile, "test", QoS::utility, false, {}, homeVolume));
  EXPECT_EQ(told->diskData(), known->diskData());
  const DiskAccessGuard unknown(
      manager_->beginAccessingURL(homeFile, "test", QoS::utility, false, {}, archiveVolume));
  EXPECT_EQ(unknown->diskInfo()->uniqueID(), "unknown");
  EXPECT_EQ(unknown->diskInfo()->maxTreads(), 1);
}

TEST_F(DiskAccessManagerTest, OpensASecurityScopeOnlyWhenAskedAndOnAVolume) {
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

TEST_F(DiskAccessManagerTest, ASessionThatIsDroppedKeepsItsPlaceAndItsScope) {
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

TEST_F(DiskAccessManagerTest, SessionsOfOneThreadNestAndCountEach) {
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

TEST_F(DiskAccessManagerTest, PassesOnWhatACallerAsksFor) {
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

TEST_F(DiskAccessManagerTest, TheRelayTellsWhichVolumeCameOrWent) {
  std::vector<std::string> told;
  std::vector<Basalt::NotificationCenter::Observer> observers;
  for (const char* name : {"NSWorkspaceDidMountNotification", "NSWorkspaceDidUnmountNotification"})
    observers.push_back(center_.addObserver(name, [&](const Basalt::Notification& notification) {
      told.push_back(
          notification.name + ' ' +
          *Platform::findAs<std::string>(notification.userInfo, "NSWorkspaceVolumeURLKey"));
    }));
  volumes_.mount({.url = stickVolume, .isLocal = {}, .isInternal = {}, .uuid = {}});
  volumes_.unmount(stickVolume);
  EXPECT_EQ(told, (std::vector<std::string>{"NSWorkspaceDidMountNotification file:///stick/",
                                            "NSWorkspaceDidUnmountNotification file:///stick/"}));
}

TEST_F(DiskAccessManagerTest, AThreadThatHoldsADiskUsesItWhateverTheLookUpFinds) {
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
      volumes_.mount({.url = stickVolume, .isLocal = {}, .isInternal = {}, .uuid = {}});
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

TEST_F(DiskAccessManagerTest, AGrantThatRacesATimeOutAdmitsTheThreadOnce) {
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

// Threads that nest sessions without a time-out while the planning queue is busy: all come through.
TEST_F(DiskAccessManagerTest, NestedSessionsNeverWaitForOneAnother) {
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
  for (const auto& [file, isBackgroundMode, threadCount] : cases) {
    manager_->setIsBackgroundMode(isBackgroundMode);
    awaitInventory();
    const std::shared_ptr<DiskData> disk = DiskAccessGuard(begin(file))->diskData();
    ASSERT_NE(disk, unknown->diskData()) << "an access that is over binds nobody";
    std::atomic<unsigned> left = threadCount;
    Tests::Crew threads(threadCount, [&, &file = file](unsigned) {
      for (int i = 0; i < 5000; ++i) {
        const DiskAccessGuard outer(begin(file));
        std::this_thread::yield();
        const DiskAccessGuard inner(begin(file));
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
  Basalt::SerialQueue& queue = DiskAccessGuard(begin(homeFile))->diskData()->queue();
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
