// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <chrono>
#include <fstream>
#include <future>
#include <random>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/SysfsMachine.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Disks/BlockDevices.h>
#include <Varnel/Platform/Linux/Disks/BlockTree.h>
#include <Varnel/Platform/Linux/Disks/FileSystemTypes.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>
#include <Varnel/Platform/Linux/Disks/UdevDatabase.h>
#include <Varnel/Platform/Linux/Disks/VirtioSerials.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::IsEmpty;

BlockDevices devicesOf(const Tests::SysfsMachine& machine) {
  return BlockDevices(machine.folder().c_str());
}

// "capable(Solid State,S1)[sda[sda1]]": the tree below the nodes that have no parent.
std::string drawn(const BlockTree& tree, std::size_t node) {
  const auto& [properties, parent, children] = tree.nodes[node];
  std::string text;
  if (const auto* name = findAs<std::string>(properties, "BSD Name")) text = *name;
  if (const bool* capable = findAs<bool>(properties, "SMART Capable")) text = *capable ? "+" : "-";
  if (const auto* facts = findAs<PropertyDictionary>(properties, "Device Characteristics"))
    text += '(' + *findAs<std::string>(*facts, "Medium Type") + ',' +
            *findAs<std::string>(*facts, "Serial Number") + ')';
  for (const std::size_t child : children) text += '[' + drawn(tree, child) + ']';
  return text;
}

std::vector<std::string> drawn(const Tests::SysfsMachine& machine) {
  VirtioSerials serials(std::chrono::minutes(1));
  const BlockTree tree = readBlockTree(devicesOf(machine), serials);
  std::vector<std::string> roots;
  for (std::size_t node = 0; node < tree.nodes.size(); ++node)
    if (!tree.nodes[node].parent) roots.push_back(drawn(tree, node));
  return roots;
}

TEST(BlockTree, HangsPartitionsAndLogicalDevicesBelowTheirDisk) {
  Tests::SysfsMachine machine;
  machine.addSCSIDisk("pci0/ata1", "sda", {{"removable", "0\n"}, {"queue/rotational", "1\n"}});
  machine.writeOnCarrier("vpd_pg80", std::string_view("\0\x80\0\x08  WD-12 \n", 12));
  machine.add("pci0/ata1/host0/0:0:0:0/block/sda/sda1", {{"partition", "1\n"}});
  machine.add("virtual/block/dm-0");
  machine.standOn("dm-0", "sda1");
  machine.add("virtual/block/dm-1");
  machine.standOn("dm-1", "dm-0");
  machine.add("virtual/block/loop0");
  machine.standOn("loop0", "sda1");  // the kernel never says so
  EXPECT_THAT(drawn(machine), ElementsAre("loop0", "+(Rotational,WD-12)[sda[sda1[dm-0[dm-1]]]]"));
  EXPECT_EQ(devicesOf(machine).areInternal({"dm-1"}), true);
  EXPECT_EQ(devicesOf(machine).areInternal({"dm-1", "loop0"}), false);
  EXPECT_EQ(devicesOf(machine).areInternal({"dm-1", "gone"}), std::nullopt);
}

TEST(BlockTree, ARaidStandsBelowEachOfItsDisksAndCirclesAreCut) {
  Tests::SysfsMachine machine;
  machine.setSubsystem("pci0/virtio1", "virtio");
  machine.setSubsystem("pci0/virtio2", "virtio");
  machine.add("pci0/virtio1/block/vdya", {{"serial", "A"}, {"queue/rotational", "0\n"}});
  machine.add("pci0/virtio2/block/vdyb", {{"serial", "B"}, {"queue/rotational", "1\n"}});
  for (const char* name : {"md0", "dm-0", "dm-1"})
    machine.add(std::string("virtual/block/") + name);
  machine.standOn("md0", "vdya");
  machine.standOn("md0", "vdyb");
  machine.standOn("dm-0", "dm-1");
  machine.standOn("dm-1", "dm-0");
  EXPECT_THAT(drawn(machine), ElementsAre("dm-1[dm-0]", "+(Solid State,A)[vdya[md0]]",
                                          "+(Rotational,B)[vdyb[md0]]"));
  EXPECT_EQ(devicesOf(machine).areInternal({"dm-0"}), std::nullopt);
}

TEST(BlockTree, DisksOnUSBAndRemovableOnesAreNotCapable) {
  Tests::SysfsMachine machine;
  machine.setSubsystem("pci0", "pci");
  machine.setSubsystem("pci0/usb1/1-1", "usb");
  machine.addSCSIDisk("pci0/usb1/1-1", "sdb", {{"removable", "0\n"}});
  machine.addSCSIDisk("pci0/ata2", "sr0", {{"removable", "1\n"}});
  machine.setSubsystem("pci0/mmc0/mmc0:1", "mmc");
  machine.add("pci0/mmc0/mmc0:1/block/mmcblk0");
  machine.add("pci0/mmc0/mmc0:1/block/mmcblk0/mmcblk0p1", {{"partition", "1\n"}});
  machine.add("pci0/odd/block/odd0");
  EXPECT_THAT(drawn(machine), ElementsAre("-[mmcblk0[mmcblk0p1]]", "-[odd0]", "-[sdb]", "-[sr0]"));
  EXPECT_EQ(devicesOf(machine).areInternal({"sdb"}), false);
  EXPECT_EQ(devicesOf(machine).areInternal({"sr0"}), false);
  EXPECT_EQ(devicesOf(machine).areInternal({"mmcblk0p1"}), true);
  EXPECT_EQ(devicesOf(machine).areInternal({"odd0"}), std::nullopt);
}

TEST(BlockTree, ADiskIsKnownByItsSerialNumberOrElseItsNameOrItsPlace) {
  Tests::SysfsMachine machine;
  machine.setSubsystem("pci0/nvme/nvme0", "nvme");
  machine.add("pci0/nvme/nvme0/nvme0n1", {{"wwid", "eui.0025\n"}, {"device/serial", " \n"}});
  machine.add("pci0/nvme/nvme0/nvme0c0n1", {{"hidden", "1\n"}});
  machine.setSubsystem("pci0/nvme/nvme1", "nvme");
  machine.add("pci0/nvme/nvme1/nvme1n1", {{"device/serial", "NVME-1  \n"}});
  machine.setSubsystem("pci0/virtio3", "virtio");
  machine.add("pci0/virtio3/block/vdya", {{"serial", ""}});
  EXPECT_THAT(drawn(machine), ElementsAre("-[nvme0c0n1]", "+(Rotational,eui.0025)[nvme0n1]",
                                          "+(Rotational,NVME-1)[nvme1n1]",
                                          "+(Rotational,devices/pci0/virtio3)[vdya]"));
}

// In a folder of this test's own, for a device that the machine has.
TEST(BlockTree, ADiskIsKnownByWhatUdevHasRecorded) {
  const auto number = readFile("/sys/class/block/loop0/dev");
  if (!number) GTEST_SKIP() << "The machine has no loop device.";
  if (const std::string reason = Tests::enterMountNamespace(); !reason.empty())
    GTEST_SKIP() << reason;
  ASSERT_TRUE(Tests::mountMemory("/run"));
  fs::create_directories("/run/udev/data");
  std::ofstream("/run/udev/data/b" + number->substr(0, number->find('\n')))
      << "E:ID_SERIAL=QEMU-7\nE:ID_SERIAL_SHORT=WD-7\n";
  Tests::SysfsMachine disk;
  disk.addSCSIDisk("pci0/ata1", "loop0", {});
  EXPECT_THAT(drawn(disk), ElementsAre("+(Rotational,WD-7)[loop0]"));
  Tests::SysfsMachine virtualDisk;
  virtualDisk.setSubsystem("pci0/virtio1", "virtio");
  virtualDisk.add("pci0/virtio1/block/loop0", {{"serial", "other"}});
  EXPECT_THAT(drawn(virtualDisk), ElementsAre("+(Rotational,QEMU-7)[loop0]"));
}

TEST(VirtioSerials, EachDiskIsAskedOnceAndNobodyWaitsForOneThatDoesNotAnswer) {
  VirtioSerials serials(std::chrono::minutes(1));
  int asked = 0;
  const auto ask = [&] { return "S" + std::to_string(++asked); };
  EXPECT_EQ(serials.of("7", ask), "S1");
  EXPECT_EQ(serials.of("7", ask), "S1");
  EXPECT_EQ(serials.of("8", ask), "S2") << "another disk in the same place";

  VirtioSerials impatient(std::chrono::milliseconds(1));
  std::promise<std::string> answer;
  EXPECT_EQ(impatient.of("9", [later = answer.get_future().share()] { return later.get(); }), "");
  answer.set_value("S9");
  EXPECT_EQ(impatient.of("9", ask), "") << "it is known by its place now";
}

TEST(BlockTree, AMissingTableIsNoTable) {
  const BlockDevices none("/nowhere");
  EXPECT_FALSE(none);
  VirtioSerials serials;
  EXPECT_THAT(readBlockTree(none, serials).nodes, IsEmpty());
}

TEST(StorageDevice, MalformedPagesHoldNoSerialNumber) {
  using namespace std::string_view_literals;
  EXPECT_EQ(serialInPage("\0\x80\0\x04WXYZuv"sv), "WXYZ");
  EXPECT_EQ(serialInPage("\0\x80\xff\xffXY"sv), "XY");
  for (const std::string_view page : {""sv, "\0\x80\0"sv, "\0\x83\0\x02XY"sv, "\0\x80\0\0XY"sv})
    EXPECT_EQ(serialInPage(page), "");
}

TEST(Udev, LinksTellTheUUIDsOfFileSystems) {
  const Tests::TemporaryFolder folder;
  fs::create_symlink("../../sda1", folder.path() / "6f1c-0e5a");
  fs::create_symlink("../../dm-0", folder.path() / "a\\x2fb\\x");
  folder.write("no-link", "");
  EXPECT_THAT(fileSystemUUIDs(folder.path().c_str()),
              ElementsAre(testing::Pair("dm-0", "a/b\\x"), testing::Pair("sda1", "6f1c-0e5a")));
  EXPECT_THAT(fileSystemUUIDs("/nowhere"), IsEmpty());
}

std::vector<std::string> reachableTargets(const std::string& table) {
  std::vector<std::string> targets;
  for (const Mount& mount : reachableMounts(parseMountInfo(table)))
    targets.push_back(std::to_string(mount.id) + mount.target);
  return targets;
}

TEST(MountInfo, ReadsEveryFormOfLineThatTheKernelWrites) {
  const std::string table =
      "27 1 254:0 / / rw,relatime shared:1 master:2 - ext4 /dev/vda rw,discard\n"
      "31 27 0:40 /@home /media/My\\040Disk\\134\\043\\012 rw - btrfs /dev/sd\\040b rw\n"
      "32 27 0:41 / /none rw shared:9 - tmpfs  rw\n"
      "33 27 0:42 / /ssh rw - fuse.sshfs me@host:/a rw";
  EXPECT_THAT(parseMountInfo(table),
              ElementsAre(Mount{27, 1, "254:0", "/", "ext4", "/dev/vda"},
                          Mount{31, 27, "0:40", "/media/My Disk\\#\n", "btrfs", "/dev/sd b"},
                          Mount{32, 27, "0:41", "/none", "tmpfs", ""},
                          Mount{33, 27, "0:42", "/ssh", "fuse.sshfs", "me@host:/a"}));
}

TEST(MountInfo, LeavesOutWhatIsNotALineOfIt) {
  for (const char* line :
       {"", "\n\n", "x 1 0:1 / /a rw - t s rw", "5 y 0:1 / /a rw - t s rw", "5 1 0:1 / /a rw",
        "5 1 0:1 / relative rw - t s rw", "5 1 0:1 / /a rw shared:1 t s rw", "5 1 0:1 / /a rw -",
        "99999999999 1 0:1 / /a rw - t s rw", "5 1 0:1 / /gone//deleted rw - t s rw"})
    EXPECT_THAT(parseMountInfo(line), IsEmpty()) << line;
  EXPECT_THAT(parseMountInfo("5 1 0:1 / /a\\04 rw - t s rw\n")[0].target, "/a\\04");
}

TEST(MountInfo, AnyBytesAndAnyRelationsComeToAnEnd) {
  std::mt19937 random(7);
  const std::string_view pieces[] = {"1 ", "2 ", "3 ", "0:1 ",  "/ ", "/a ", "/a/b ",
                                     "- ", "t ", "\\", "\\040", "\n", " ",   "\xff"};
  for (int run = 0; run < 20000; ++run) {
    std::string table;
    for (int i = 0; i < 40; ++i) table += pieces[random() % std::size(pieces)];
    (void)reachableTargets(table);
  }
  std::string deep;
  for (int i = 1; i < 50000; ++i)
    deep += std::to_string(i) + ' ' + std::to_string(i + 1) + " 0:1 / / rw - t s rw\n";
  EXPECT_THAT(reachableTargets(deep), ElementsAre("1/"));
}

TEST(MountInfo, KeepsOnlyTheMountsThatAPathCanReach) {
  const auto line = [](int id, int parent, const std::string& target) {
    return std::to_string(id) + ' ' + std::to_string(parent) + " 0:1 / " + target +
           " rw - tmpfs t rw\n";
  };
  const std::string root = line(1, 0, "/");
  const std::pair<std::string, std::vector<std::string>> cases[] = {
      {root + line(2, 1, "/a") + line(3, 2, "/a/b"), {"1/", "2/a", "3/a/b"}},
      // stacked on the same folder: the last one is seen
      {root + line(2, 1, "/a") + line(3, 2, "/a") + line(4, 3, "/a"), {"1/", "4/a"}},
      // a later mount over a folder above hides the earlier one, and what stands on it
      {root + line(2, 1, "/a/b") + line(3, 2, "/a/b/c") + line(4, 1, "/a"), {"1/", "4/a"}},
      {root + line(2, 1, "/a/b") + line(3, 1, "/a") + line(4, 3, "/a/b"), {"1/", "3/a", "4/a/b"}},
      // a name that only begins alike is another folder
      {root + line(2, 1, "/ab") + line(3, 1, "/a"), {"1/", "2/ab", "3/a"}},
      // a new root over the old one
      {root + line(2, 1, "/home") + line(3, 1, "/"), {"3/"}},
      // roots that are their own parents, or whose parent is out of sight
      {line(1, 1, "/") + line(2, 1, "/a") + line(9, 77, "/b"), {"1/", "2/a", "9/b"}},
      {line(5, 6, "/a") + line(6, 5, "/b"), {}},
  };
  for (const auto& [table, reachable] : cases) EXPECT_EQ(reachableTargets(table), reachable);
}

TEST(FileSystemTypes, OnlyTheKernelsOwnAreNoVolumesAndOnlyRemoteOnesAreNetwork) {
  for (const char* type : {"proc", "sysfs", "devtmpfs", "cgroup2", "autofs", "nsfs", "fusectl"})
    EXPECT_TRUE(isPseudoFileSystem(type)) << type;
  for (const char* type : {"tmpfs", "overlay", "fuse", "fuseblk", "ext4", "squashfs", "virtiofs"}) {
    EXPECT_FALSE(isPseudoFileSystem(type)) << type;
    EXPECT_FALSE(isNetworkFileSystem(type)) << type;
  }
  for (const char* type : {"nfs", "nfs4", "cifs", "smb3", "ceph", "davfs", "9p", "glusterfs",
                           "fuse.sshfs", "fuse.rclone", "fuse.glusterfs"})
    EXPECT_TRUE(isNetworkFileSystem(type)) << type;
}

}  // namespace
}  // namespace Varnel::Platform::Linux
