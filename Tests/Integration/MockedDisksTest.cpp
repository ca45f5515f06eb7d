// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <umockdev.h>

#include <memory>

#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel {
namespace {

using testing::Contains;
using testing::IsEmpty;

constexpr std::string_view nvme = "/devices/pci0000:00/0000:00:01.0/nvme/nvme0";
constexpr std::string_view sata = "/devices/pci0000:00/0000:00:02.0/ata1/host0/target0:0:0/0:0:0:0";
constexpr std::string_view usb = "/devices/pci0000:00/0000:00:03.0/usb1/1-1/1-1:1.0";

std::string entry(const std::string& place, const std::string& subsystem,
                  const std::string& further = "") {
  return "P: " + place + "\nE: SUBSYSTEM=" + subsystem + "\n" + further + "\n";
}

std::string blockEntry(const std::string& place, const std::string& number,
                       const std::string& further = "") {
  const std::string name = place.substr(place.rfind('/') + 1);
  return entry(place, "block",
               "N: " + name + "\nE: DEVNAME=/dev/" + name + "\nA: dev=" + number +
                   "\\n\nA: removable=0\\n\n" + further);
}

std::string partition(const std::string& place, const std::string& number) {
  return blockEntry(place, number, "A: partition=1\\n\n");
}

std::string numberOfRoot() {
  struct stat root {};
  ::stat("/", &root);
  return std::to_string(major(root.st_dev)) + ':' + std::to_string(minor(root.st_dev));
}

// A solid-state disk, a hard disk with the running system's root on its second partition, a stick.
std::string machine() {
  const std::string ssd(nvme);
  const std::string disk(sata);
  const std::string stick(usb);
  return entry(ssd, "nvme", "A: serial=NVME-1  \\n\n") +
         blockEntry(ssd + "/nvme0n1", "259:0",
                    "A: queue/rotational=0\\n\nL: device=../../nvme0\n") +
         partition(ssd + "/nvme0n1/nvme0n1p1", "259:1") +
         partition(ssd + "/nvme0n1/nvme0n1p2", "259:2") + entry(disk, "scsi") +
         blockEntry(disk + "/block/sda", "8:0",
                    "A: queue/rotational=1\\n\nE: ID_SERIAL_SHORT=SATA-1\n") +
         partition(disk + "/block/sda/sda1", "8:1") +
         partition(disk + "/block/sda/sda2", numberOfRoot()) + entry(stick, "usb") +
         entry(stick + "/host1/target1:0:0/1:0:0:0", "scsi") +
         blockEntry(stick + "/host1/target1:0:0/1:0:0:0/block/sdb", "8:16",
                    "A: queue/rotational=1\\n\nE: ID_SERIAL_SHORT=USB-1\n") +
         partition(stick + "/host1/target1:0:0/1:0:0:0/block/sdb/sdb1", "8:17");
}

class MockedDisks : public testing::Test {
 protected:
  void SetUp() override {
    const char* preloaded = ::getenv("LD_PRELOAD");
    if (!preloaded || std::string_view(preloaded).find("umockdev") == std::string_view::npos)
      GTEST_SKIP() << "run me with umockdev-wrapper";
    testbed_.reset(umockdev_testbed_new());
    GError* error = nullptr;
    ASSERT_TRUE(umockdev_testbed_add_from_string(testbed_.get(), machine().c_str(), &error))
        << error->message;
  }

  OVDiskInfo::Array inventory() {
    return OVDiskInfo::allDiskInfos({.devices = *devices_, .disks = *disks_, .volumes = *volumes_});
  }

  struct Unref {
    void operator()(UMockdevTestbed* testbed) const { g_object_unref(testbed); }
  };
  std::unique_ptr<UMockdevTestbed, Unref> testbed_;
  const std::shared_ptr<Platform::Linux::MountTable> table_ = Platform::Linux::makeMountTable();
  const std::unique_ptr<Platform::DeviceRegistry> devices_ = Platform::Linux::makeDeviceRegistry();
  const std::unique_ptr<Platform::DiskArbitration> disks_ =
      Platform::Linux::makeDiskArbitration(table_);
  const std::unique_ptr<Platform::VolumeCatalog> volumes_ =
      Platform::Linux::makeVolumeCatalog(table_);
};

TEST_F(MockedDisks, FixedDisksAreDevicesWithTheirKindAndTheStickIsNone) {
  const auto all = inventory();
  ASSERT_GE(all.size(), 2u);
  const auto& solidState = *all[0];
  EXPECT_EQ(solidState.uniqueID(), "NVME-1");
  EXPECT_EQ(solidState.kind(), OVDiskKindSolidState);
  EXPECT_THAT(*solidState.volumeURLs(), IsEmpty());
  const auto& rotational = *all[1];
  EXPECT_EQ(rotational.uniqueID(), "SATA-1");
  EXPECT_EQ(rotational.kind(), OVDiskKindRotational);
  // Where the running system's root lies on no block device, it cannot lie on a mocked one.
  if (!numberOfRoot().starts_with("0:")) {
    EXPECT_THAT(*rotational.volumeURLs(), Contains(Platform::URL::fileURLWithPath("/")));
  }
  for (std::size_t i = 2; i < all.size(); ++i) EXPECT_NE(all[i]->uniqueID(), "USB-1");
}

}  // namespace
}  // namespace Varnel
