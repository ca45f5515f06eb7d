// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <random>

#include <Varnel/Platform/Linux/Disks/FileSystemTypes.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>

namespace Varnel::Platform::Linux {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

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
