// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <latch>
#include <optional>
#include <thread>
#include <utility>

#include <Varnel/Basalt/NotificationCenter.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/VolumeChangeRelay.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Tests {

using Platform::URL;
using QoS = Platform::QualityOfService;
using Session = std::unique_ptr<DiskAccessingSession>;

inline const URL homeVolume = URL::fileURLWithPath("/home/");
inline const URL archiveVolume = URL::fileURLWithPath("/archive/");
inline const URL stickVolume = URL::fileURLWithPath("/stick/");
inline const URL homeFile = URL::fileURLWithPath("/home/file");
inline const URL stickFile = URL::fileURLWithPath("/stick/file");

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
class DiskAccessFixture : public ::testing::Test {
 protected:
  DiskAccessFixture() {
    plugDisk("SSD-1", "nvme0n1", "Solid State", homeVolume);
    volumes_.setVolumes({plain(homeVolume)});
    manager_.emplace(DiskAccessManager::Ports{registry_, disks_, volumes_, scope_, center_});
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

  /// A volume of which nothing more is known.
  static Platform::MountedVolume plain(const URL& volume) {
    return {.url = volume, .isLocal = {}, .isInternal = {}, .uuid = {}};
  }

  /// The inventories that this thread has asked for precede its next access.
  void awaitInventory() {
    if (const auto session = begin(homeFile)) session->endAccessing();
  }

  void mount(const Platform::MountedVolume& volume) {
    volumes_.mount(volume);
    awaitInventory();
  }
  void mount(const URL& volume) { mount(plain(volume)); }
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
  Session beginOnKnownDisk(const URL& file, std::optional<double> timeout = {},
                           QoS qos = QoS::utility) {
    Session session = begin(file, timeout, qos);
    while (session && session->diskInfo()->uniqueID() == "unknown") {
      session->endAccessing();
      session = begin(file, timeout, qos);
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

  /// The machine's calls from now on count and go wrong by one plan. To be set between inventories.
  void setFaults(const std::shared_ptr<Platform::Testing::FaultPlan>& faults) {
    devices_.faults = disks_.faults = volumes_.faults = scope_.faults = faults;
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

}  // namespace Varnel::Tests
