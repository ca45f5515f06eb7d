// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <functional>
#include <vector>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Process/KeyFileDefaults.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using ::testing::HasSubstr;

class UserDefaultsTest : public ::testing::Test {
 protected:
  Linux::KeyFileDefaults open() const { return {*files_, log, path_.string()}; }

  const Tests::TemporaryFolder folder_;
  const fs::path path_ = folder_.path() / "new" / "settings.ini";
  mutable Testing::CapturedSystemLog log;
  const std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
};

TEST_F(UserDefaultsTest, ProcessesKeepEachOthersKeys) {
  constexpr int processes = 4;
  constexpr int keys = 25;
  for (int process = 0; process < processes; ++process) {
    if (::fork() != 0) continue;
    auto defaults = open();
    // On a slow disk the others may keep the lock for longer than a call waits; then it says so.
    for (int key = process, tries = 0; key < processes * keys && tries < 300; ++tries)
      if (!defaults.set(std::to_string(key), std::int64_t{key})) key += processes;
    ::_exit(0);
  }
  while (::wait(nullptr) > 0) continue;
  const auto defaults = open();
  for (int key = 0; key < processes * keys; ++key)
    EXPECT_EQ(defaults.integer(std::to_string(key)), key);
}

TEST_F(UserDefaultsTest, AFaultLeavesTheOldValueOrTheNewAndSaysWhich) {
  for (const auto fault : {Testing::Fault::fails, Testing::Fault::absent}) {
    const auto calls = Testing::sweepFaults(fault, [&](const auto& faults) {
      ASSERT_FALSE(open().set("key", std::int64_t{1}));
      Testing::FaultyPrivateFiles files(*files_);
      files.faults = faults;
      Linux::KeyFileDefaults defaults(files, log, path_.string());
      const bool isKept = !defaults.set("key", std::int64_t{2});
      EXPECT_EQ(open().integer("key"), isKept ? 2 : 1);
      faults->mend();
      EXPECT_FALSE(defaults.set("key", std::int64_t{3})) << "whatever the fault has left";
      EXPECT_EQ(open().integer("key"), 3);
    });
    EXPECT_GE(calls, 4u);
  }
}

TEST_F(UserDefaultsTest, ADamagedFileCountsAsEmptyAndIsSetAside) {
  const std::string damaged = "[Defaults]\nkey=true\n\xFF\n[[]=\n";
  folder_.write("new/settings.ini", damaged);
  auto defaults = open();
  EXPECT_EQ(defaults.truthValue("key"), std::nullopt);
  EXPECT_EQ(*readFile(path_), damaged) << "a reader changes nothing";
  EXPECT_FALSE(defaults.set("other", false));
  EXPECT_EQ(defaults.truthValue("other"), false);
  EXPECT_EQ(*readFile(path_.string() + ".damaged"), damaged);
  const std::string said = log.text();
  EXPECT_THAT(said, HasSubstr(path_.string() + " are damaged"));
  EXPECT_EQ(std::count(said.begin(), said.end(), '\n'), 1);
}

// As root with another's home: that user would be locked out of what is made there.
TEST_F(UserDefaultsTest, NothingIsMadeInTheFoldersOfOthers) {
  const fs::path home = folder_.path() / "home";
  fs::create_directory(home);
  constexpr ::uid_t other = 65534;
  if (::geteuid() != 0 || ::chown(home.c_str(), other, other) != 0)
    GTEST_SKIP() << "Only root can write there.";
  Linux::KeyFileDefaults defaults(*files_, log, (home / ".config/app/settings.ini").string());
  EXPECT_TRUE(defaults.set("key", true));
  EXPECT_FALSE(POSIX::makeAppendFiles()->open(home / "day.log"));
  EXPECT_TRUE(fs::is_empty(home));
}

// Whatever stands in the way: the answer says so, and what was there stays as it was.
TEST_F(UserDefaultsTest, AFailureIsToldAndLosesNothing) {
  const fs::path folder = path_.parent_path();
  ASSERT_FALSE(open().set("key", std::string("old")));
  const std::string before = *readFile(path_);
  const fs::path elsewhere = folder_.write("elsewhere", before);
  const std::string reason = Tests::enterMountNamespace();

  struct Row {
    const char* name;
    bool needsMounts;
    bool isReadable;
    std::function<void()> begin;
  };
  std::unique_ptr<FileLock> lock;
  const auto fill = [&] {
    ASSERT_EQ(::mount("varnel-test", folder.c_str(), "tmpfs", 0, "size=64k,mode=700"), 0);
    std::ofstream(path_) << before;
    std::ofstream(folder / "filler") << std::string(1 << 20, 'x');
  };
  const auto makeReadOnly = [&] {
    ASSERT_EQ(::mount(folder.c_str(), folder.c_str(), nullptr, MS_BIND, nullptr), 0);
    constexpr auto flags = MS_BIND | MS_REMOUNT | MS_RDONLY;
    ASSERT_EQ(::mount(nullptr, folder.c_str(), nullptr, flags, nullptr), 0);
  };
  const std::vector<Row> rows = {
      {"locked", false, true,
       [&] { lock = std::move(*files_->tryLock(path_.string() + ".lock")); }},
      {"a link", false, false,
       [&] {
         lock.reset();
         fs::remove(path_);
         fs::create_symlink(elsewhere, path_);
       }},
      {"a folder", false, false,
       [&] {
         fs::remove(path_);
         fs::create_directory(path_);
       }},
      {"a full disk", true, true, fill},
      {"a read-only disk", true, true, makeReadOnly},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.name);
    if (row.needsMounts && !reason.empty()) GTEST_SKIP() << reason;
    row.begin();
    auto defaults = open();
    EXPECT_TRUE(defaults.set("key", std::string(100'000, 'n')));
    EXPECT_TRUE(defaults.remove("key"));
    EXPECT_EQ(defaults.text("key"),
              row.isReadable ? std::optional<std::string>("old") : std::nullopt);
    EXPECT_FALSE(fs::exists(path_.string() + ".new"));
    EXPECT_EQ(*readFile(elsewhere), before);
  }
}

}  // namespace
}  // namespace Varnel::Platform
