// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <iostream>
#include <thread>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace {
enum class Kernel { current, withoutMountIDs, withoutStatx } kernel = Kernel::current;
}  // namespace

// In place of the C library's.
extern "C" int statx(int folder, const char* path, int flags, unsigned mask,
                     struct statx* facts) noexcept {
  if (kernel == Kernel::withoutStatx) return errno = ENOSYS, -1;
  const auto result = static_cast<int>(::syscall(SYS_statx, folder, path, flags, mask, facts));
  if (kernel == Kernel::withoutMountIDs) {
    facts->stx_mask &= ~static_cast<unsigned>(STATX_MNT_ID);
    facts->stx_mnt_id = 0;
  }
  return result;
}

namespace Varnel {
namespace {

using Platform::URL;
using Platform::VolumeChange;

class MountedVolumes : public testing::Test {
 protected:
  void SetUp() override {
    const std::string reason = Tests::enterMountNamespace();
    if (!reason.empty()) GTEST_SKIP() << reason;
    table = Platform::Linux::makeMountTable();
    catalog = Platform::Linux::makeVolumeCatalog(table);
  }

  std::filesystem::path makeFolder(const std::string& name) {
    std::filesystem::create_directories(folder.path() / name);
    return folder.path() / name;
  }
  static URL volumeAt(const std::filesystem::path& path) {
    return URL::fileURLWithPath(path.string() + "/");
  }

  Tests::TemporaryFolder folder;
  std::shared_ptr<Platform::Linux::MountTable> table;
  std::unique_ptr<Platform::VolumeCatalog> catalog;
};

TEST_F(MountedVolumes, EveryPlaceOfADeviceCountsAndHiddenOnesDoNot) {
  const auto base = makeFolder("base");
  ASSERT_TRUE(Tests::mountMemory(base));
  const auto inside = makeFolder("base/inside");
  const auto elsewhere = makeFolder("elsewhere");
  ASSERT_EQ(::mount(inside.c_str(), elsewhere.c_str(), nullptr, MS_BIND, nullptr), 0);
  const auto file = makeFolder("elsewhere/sub");
  EXPECT_EQ(catalog->volumeURL(volumeAt(file)).value(), volumeAt(elsewhere));
  EXPECT_EQ(catalog->volumeURL(volumeAt(inside)).value(), volumeAt(base));

  ASSERT_TRUE(Tests::mountMemory(inside));
  ASSERT_TRUE(Tests::mountMemory(base));
  EXPECT_EQ(catalog->volumeName(volumeAt(inside)), std::nullopt) << "hidden by the mount above";
  EXPECT_EQ(catalog->volumeURL(volumeAt(base)).value(), volumeAt(base));
}

TEST_F(MountedVolumes, AChangedRootFolderIsAVolumeAlthoughNoMountStandsThere) {
  const auto root = makeFolder("root");
  const auto proc = makeFolder("root/proc");
  folder.write("root/file", "content");
  ASSERT_EQ(::mount("/proc", proc.c_str(), nullptr, MS_BIND | MS_REC, nullptr), 0);
  const auto findVolume = [&] {
    if (::chroot(root.c_str()) != 0) ::_exit(2);
    const auto found = catalog->volumeURL(URL::fileURLWithPath("/file"));
    ::_exit(found && *found == URL::fileURLWithPath("/") ? 0 : 1);
  };
  EXPECT_EXIT(findVolume(), testing::ExitedWithCode(0), "");
}

TEST_F(MountedVolumes, AreFoundByTheirFilesAndLinksOnKernelsOldAndNew) {
  const auto place = makeFolder("place");
  ASSERT_TRUE(Tests::mountMemory(place));
  std::filesystem::create_symlink("/no such file", place / "dangling");
  std::filesystem::create_symlink("/proc/self/status", place / "elsewhere");
  const auto findVolumes = [&](Kernel present) {
    kernel = present;
    const auto find = [&](const std::string& path) {
      const auto found = catalog->volumeURL(URL::fileURLWithPath(path));
      std::cerr << (!found ? "failed" : *found ? (*found)->path() : "none") << '\n';
    };
    find(place);
    for (const char* link : {"dangling", "elsewhere"}) find(place / link);
    find("/proc/self/status");
    find(place / "no such file");
    ::_exit(0);
  };
  std::string found;
  for (int i = 0; i < 3; ++i) found += place.string() + '\n';
  for (const Kernel each : {Kernel::current, Kernel::withoutMountIDs, Kernel::withoutStatx})
    EXPECT_EXIT(findVolumes(each), testing::ExitedWithCode(0), found + "none\nfailed\n");
}

TEST_F(MountedVolumes, LooksUpWhileMountsComeAndGo) {
  const auto place = makeFolder("place");
  const URL url = volumeAt(place);
  const URL below = catalog->volumeURL(url).value().value();
  std::atomic<bool> done = false;
  std::atomic<int> wrong = 0;
  std::vector<std::thread> readers;
  for (int i = 0; i < 3; ++i)
    readers.emplace_back([&] {
      while (!done) {
        const auto found = catalog->volumeURL(url);
        // What was found may be unmounted before it is named, but nothing else is ever found.
        if (!found || (*found && **found != url && **found != below)) ++wrong;
        (void)catalog->mountedVolumes();
      }
    });
  for (int i = 0; i < 100; ++i) {
    const auto subscription = catalog->subscribe([](const VolumeChange&) {});
    ASSERT_TRUE(Tests::mountMemory(place));
    ASSERT_EQ(catalog->volumeURL(url).value(), url);
    ASSERT_EQ(::umount2(place.c_str(), MNT_DETACH), 0);
    ASSERT_EQ(catalog->volumeURL(url).value(), below);
  }
  done = true;
  for (auto& reader : readers) reader.join();
  EXPECT_EQ(wrong, 0);
}

}  // namespace
}  // namespace Varnel
