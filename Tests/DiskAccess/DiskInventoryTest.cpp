// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel {
namespace {

using Platform::MountedVolume;
using Platform::PropertyDictionary;
using Platform::PropertyValue;
using Platform::URL;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

URL folder(const std::string& path) {
  return URL::fileURLWithPath(path);
}

MountedVolume volume(const std::string& path, std::optional<bool> isLocal = true,
                     std::optional<bool> isInternal = std::nullopt,
                     std::optional<std::string> uuid = std::nullopt) {
  return {.url = folder(path), .isLocal = isLocal, .isInternal = isInternal, .uuid = uuid};
}

class DiskInventory : public testing::Test {
 protected:
  // Every handle that an inventory took must be back, whatever way it went.
  ~DiskInventory() override {
    EXPECT_EQ(devices.liveEntries(), 0);
    EXPECT_EQ(disks.liveSessions(), 0);
  }

  OVDiskInfo::Array inventory() {
    auto all = OVDiskInfo::allDiskInfos({.devices = devices, .disks = disks, .volumes = volumes});
    EXPECT_EQ(devices.liveEntries(), 0);
    return all;
  }

  Platform::Testing::FakeDeviceRegistry::Device plugDevice(PropertyDictionary characteristics) {
    return devices.plug(
        {{"SMART Capable", true}, {"Device Characteristics", std::move(characteristics)}});
  }

  Platform::Testing::FakeDeviceRegistry devices;
  Platform::Testing::FakeDiskArbitration disks;
  Platform::Testing::FakeVolumeCatalog volumes;
};

TEST_F(DiskInventory, DisksAreEqualByIdentifierAloneAndAMissingOneEqualsNothing) {
  const OVDiskInfo disk("a", OVDiskInfo::VolumeURLs{folder("/")}, OVDiskKindSolidState);
  const OVDiskInfo same("a", std::nullopt, OVDiskKindNetwork);
  const OVDiskInfo empty("", std::nullopt, OVDiskKindUnknown);
  const OVDiskInfo nameless(std::nullopt, std::nullopt, OVDiskKindUnknown);
  EXPECT_EQ(disk, same);
  EXPECT_EQ(std::hash<OVDiskInfo>{}(disk), std::hash<OVDiskInfo>{}(same));
  EXPECT_FALSE(empty == nameless);
  EXPECT_FALSE(disk.isEqual(nullptr));
  EXPECT_TRUE(nameless.isEqual(nullptr));
}

TEST_F(DiskInventory, AllVolumesOfOneDeviceShareItsDisk) {
  const auto ssd = plugDevice({{"Medium Type", "Solid State"}, {"Serial Number", "S1"}});
  const auto disk = devices.plug({{"BSD Name", "sda"}}, ssd);
  const auto system = devices.plug({{"BSD Name", "sda1"}}, disk);
  devices.plug({{"BSD Name", "sda2"}}, disk);
  // A driver's entry in between has no name of its own.
  const auto crypt = devices.plug({}, system);
  devices.plug({{"BSD Name", "dm-0"}}, crypt);
  disks.setMountURLs("sda2", {folder("/data/"), folder("/srv/data/")});
  disks.setMountURLs("dm-0", {folder("/")});
  volumes.setVolumes({volume("/"), volume("/data/"), volume("/srv/data/"), volume("/run/")});

  const auto all = inventory();
  ASSERT_THAT(all, SizeIs(2));
  EXPECT_EQ(all[0]->uniqueID(), "S1");
  EXPECT_EQ(all[0]->kind(), OVDiskKindSolidState);
  EXPECT_THAT(*all[0]->volumeURLs(),
              ElementsAre(folder("/"), folder("/data/"), folder("/srv/data/")));
  EXPECT_THAT(*all[1]->volumeURLs(), ElementsAre(folder("/run/")));
}

TEST_F(DiskInventory, OnlyTheExactMediumTypeMakesASolidStateDisk) {
  const std::pair<PropertyDictionary, OVDiskKind> cases[] = {
      {{{"Medium Type", "Solid State"}}, OVDiskKindSolidState},
      {{{"Medium Type", "solid state"}}, OVDiskKindRotational},
      {{{"Medium Type", "Rotational"}}, OVDiskKindRotational},
      {{{"Medium Type", PropertyValue(true)}}, OVDiskKindRotational},
      {{}, OVDiskKindRotational}};
  for (const auto& [characteristics, kind] : cases) {
    const auto device = plugDevice(characteristics);
    const auto all = inventory();
    ASSERT_THAT(all, SizeIs(1));
    EXPECT_EQ(all[0]->kind(), kind);
    devices.unplug(device);
  }
}

TEST_F(DiskInventory, ADeviceThatTellsLittleIsStillADisk) {
  plugDevice({{"Serial Number", std::int64_t{7}}});  // not a text, and nothing below
  const auto unreadable = plugDevice({{"Serial Number", "S2"}});
  devices.plug({{"BSD Name", "sdb"}}, unreadable);
  devices.breakProperties(unreadable);
  const auto bare = devices.plug({{"SMART Capable", true}});
  devices.plug({{"BSD Name", std::int64_t{3}}}, bare);

  const auto first = inventory();
  const auto second = inventory();
  ASSERT_THAT(first, SizeIs(3));
  EXPECT_FALSE(first[0]->volumeURLs());
  ASSERT_TRUE(first[1]->volumeURLs());
  EXPECT_THAT(*first[1]->volumeURLs(), IsEmpty());
  EXPECT_FALSE(first[2]->volumeURLs());
  for (std::size_t i = 0; i < first.size(); ++i) {
    EXPECT_EQ(first[i]->kind(), OVDiskKindRotational);
    EXPECT_THAT(*first[i]->uniqueID(), SizeIs(36));
    EXPECT_FALSE(*first[i] == *second[i]) << "without a serial number, new in each inventory";
  }
}

TEST_F(DiskInventory, DevicesThatAreNotCapableLeaveTheirVolumesToThemselves) {
  const auto usb = devices.plug({{"SMART Capable", false}});
  devices.plug({{"BSD Name", "sdc1"}}, usb);
  disks.setMountURLs("sdc1", {folder("/media/stick/")});
  volumes.setVolumes({volume("/media/stick/", true, false, "AB-CD")});

  const auto all = inventory();
  ASSERT_THAT(all, SizeIs(1));
  EXPECT_EQ(all[0]->uniqueID(), "AB-CD");
  EXPECT_EQ(all[0]->kind(), OVDiskKindExternal);
}

TEST_F(DiskInventory, KindsOfVolumesFollowFromWhatTheirFlagsSay) {
  using Flag = std::optional<bool>;
  const std::tuple<Flag, Flag, OVDiskKind> cases[] = {
      {false, false, OVDiskKindNetwork},      {false, true, OVDiskKindNetwork},
      {true, false, OVDiskKindExternal},      {std::nullopt, false, OVDiskKindExternal},
      {true, true, OVDiskKindUnknown},        {true, std::nullopt, OVDiskKindUnknown},
      {std::nullopt, true, OVDiskKindUnknown}};
  for (const auto& [isLocal, isInternal, kind] : cases) {
    volumes.setVolumes({volume("/v/", isLocal, isInternal)});
    const auto all = inventory();
    ASSERT_THAT(all, SizeIs(1));
    EXPECT_EQ(all[0]->kind(), kind);
    EXPECT_EQ(all[0]->maxTreads(), 1);
    EXPECT_THAT(*all[0]->uniqueID(), SizeIs(36));
  }
}

TEST_F(DiskInventory, ServicesOutOfReachLeaveWhatTheOthersTell) {
  const auto device = plugDevice({{"Serial Number", "S1"}});
  devices.plug({{"BSD Name", "sda"}}, device);
  disks.setMountURLs("sda", {folder("/")});
  volumes.setVolumes({volume("/", true, true, "U1")});

  disks.setReachable(false);
  auto all = inventory();
  ASSERT_THAT(all, SizeIs(2));
  EXPECT_FALSE(all[0]->volumeURLs());
  EXPECT_EQ(all[1]->uniqueID(), "U1");

  devices.setReadable(false);
  all = inventory();
  ASSERT_THAT(all, SizeIs(1));
  EXPECT_EQ(all[0]->uniqueID(), "U1");
}

TEST_F(DiskInventory, TheServiceOfAnEntryIsTheNearestOneAbove) {
  const auto outer = plugDevice({});
  const auto inner = devices.plug({{"SMART Capable", false}, {"BSD Name", "x"}}, outer);
  const auto disk = devices.plug({{"BSD Name", "sda"}}, inner);
  const auto partition = devices.plug({{"BSD Name", "sda1"}}, disk);
  const auto nameOfService = [&](auto device) -> std::string {
    const auto service = OVDiskInfo::serviceForDevice(devices.entry(device));
    if (!service) return "none";
    const auto name = service->property("BSD Name");
    return name ? *name->template as<std::string>() : "unnamed";
  };
  EXPECT_EQ(nameOfService(partition), "x");
  EXPECT_EQ(nameOfService(inner), "x");
  EXPECT_EQ(nameOfService(outer), "unnamed");
  EXPECT_EQ(nameOfService(devices.plug({})), "none");
  devices.breakParent(disk);
  EXPECT_EQ(nameOfService(partition), "none");
}

TEST_F(DiskInventory, AVolumeOverTwoDisksIsInBothAndListedNowhereElse) {
  const auto first = plugDevice({{"Serial Number", "S1"}});
  const auto second = plugDevice({{"Serial Number", "S2"}});
  const auto raid = devices.plug({{"BSD Name", "md0"}}, first);
  devices.attach(raid, second);
  disks.setMountURLs("md0", {folder("/raid/")});
  volumes.setVolumes({volume("/raid/")});

  const auto all = inventory();
  ASSERT_THAT(all, SizeIs(2));
  for (const auto& disk : all) EXPECT_THAT(*disk->volumeURLs(), ElementsAre(folder("/raid/")));
}

}  // namespace
}  // namespace Varnel
