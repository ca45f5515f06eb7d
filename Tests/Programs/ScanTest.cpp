// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <climits>
#include <filesystem>
#include <map>
#include <random>
#include <set>
#include <sstream>

#include <Scan/DuplicateFinder.h>
#include <Tests/Programs/ScanFakes.h>
#include <Tests/Programs/ScanFolder.h>
#include <Tests/Support/ForbiddenCalls.h>

namespace {
bool hidesKinds = false;
}  // namespace

// In place of the C library's: some file systems tell no kinds with the names.
extern "C" dirent* readdir(DIR* folder) {
  static const auto real = reinterpret_cast<decltype(&readdir)>(::dlsym(RTLD_NEXT, "readdir"));
  dirent* const entry = real(folder);
  if (entry && hidesKinds) entry->d_type = DT_UNKNOWN;
  return entry;
}

namespace Orvane::Testing {
namespace {

namespace fs = std::filesystem;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;
using Groups = std::vector<std::vector<std::string>>;

class Scan : public ::testing::Test {
 protected:
  ScanResult scan(const std::vector<std::string>& folders) {
    return DuplicateFinder({fileSystem, access, losses}, 4).find(folders, control);
  }
  ScanResult scan() { return scan({folder.path()}); }

  static Groups paths(const ScanResult& result) {
    Groups groups;
    for (const DuplicateGroup& group : result.groups) groups.push_back(group.paths);
    return groups;
  }

  void TearDown() override {
    EXPECT_EQ(access.faults, 0) << "accesses were nested";
    EXPECT_EQ(fileSystem.faults, 0) << "content was read outside an access";
  }

  ScanFolder folder;
  FaultyFileSystem fileSystem;
  OpenAccess access;
  LossRecorder losses;
  ScanControl control;
};

std::string bytes(std::size_t count, char last) {
  std::string text(count, 'x');
  text.back() = last;
  return text;
}

TEST_F(Scan, TellsContentsApartToTheLastByte) {
  Groups expected;
  for (const std::size_t size : {1u, 4095u, 4096u, 4097u, 524'288u, 524'289u, 1'500'000u}) {
    const std::string name = std::to_string(size);
    expected.push_back({folder.write(name + "/1", bytes(size, 'a')),
                        folder.write(name + "/2", bytes(size, 'a')),
                        folder.write(name + "/3", bytes(size, 'a'))});
    expected.push_back(
        {folder.write(name + "/4", bytes(size, 'b')), folder.write(name + "/5", bytes(size, 'b'))});
    folder.write(name + "/6", bytes(size, 'c'));
  }
  // Two of a size that differ behind a common beginning are compared without a digest.
  folder.write("pair/1", bytes(70'000, 'a'));
  folder.write("pair/2", bytes(70'000, 'b'));
  EXPECT_THAT(paths(scan()), ::testing::UnorderedElementsAreArray(expected));
}

TEST_F(Scan, CountsEveryKindOfFileOnce) {
  const std::string original = folder.write("b/original", "content");
  const std::string copy = folder.write("b/deep/er/copy", "content");
  fs::create_hard_link(original, folder.path("a-link"));
  fs::create_symlink(original, folder.path("symlink"));
  fs::create_directory_symlink(folder.path("b"), folder.path("symlinked"));
  folder.write("empty1", "");
  folder.write("empty2", "");
  fs::create_hard_link(folder.write("alone", "other"), folder.path("alone-again"));

  ScanTotals expected;
  expected.folders = 4;
  expected.files = 7;
  expected.bytes = 19;
  expected.emptyFiles = 2;
  expected.hardLinks = 2;
  expected.duplicateFiles = 1;
  expected.wastedBytes = 7;
  for (const bool areHidden : {true, false}) {
    hidesKinds = areHidden;
    const ScanResult result = scan();
    EXPECT_THAT(paths(result), ElementsAre(ElementsAre(folder.path("a-link"), copy)));
    EXPECT_EQ(result.totals, expected);
  }
}

TEST_F(Scan, WalksOverlappingFoldersOnce) {
  folder.write("one/a", "same");
  folder.write("one/two/b", "same");
  const ScanResult once = scan();
  const ScanResult twice =
      scan({folder.path("one/two"), folder.path(), folder.path("one"), folder.path()});
  EXPECT_EQ(twice.groups, once.groups);
  EXPECT_EQ(twice.totals, once.totals);
}

TEST_F(Scan, LeavesOutWhatCannotBeRead) {
  const std::string first = folder.write("1", "same");
  const std::string second = folder.write("2", "same");
  const std::string closed = folder.write("closed", "same");
  const std::string broken = folder.write("broken", "same");
  folder.write("locked/file", "same");
  const std::string kept = folder.write("torn/kept", "same");
  fileSystem.interruptions[folder.path("torn")] = std::errc::io_error;
  fileSystem.openFaults[closed] = std::errc::permission_denied;
  fileSystem.readFaults[broken] = std::errc::io_error;
  fileSystem.listFaults[folder.path("locked")] = std::errc::permission_denied;

  const ScanResult result = scan();
  EXPECT_THAT(paths(result), ElementsAre(ElementsAre(first, second, kept)));
  EXPECT_EQ(result.totals.unreadableFiles, 2u);
  EXPECT_EQ(result.totals.unreadableFolders, 2u);
  EXPECT_THAT(losses.files, ElementsAre(Pair(broken, Loss::Kind::unreadable),
                                        Pair(closed, Loss::Kind::unreadable)));
  EXPECT_THAT(losses.folders, ElementsAre(Pair(folder.path("locked"), Loss::Kind::unreadable),
                                          Pair(folder.path("torn"), Loss::Kind::incomplete)));

  // A folder to scan is another matter.
  const ScanResult nothing = scan({folder.path("torn"), folder.path("locked")});
  ASSERT_EQ(nothing.lostFolders.size(), 1u);
  EXPECT_EQ(nothing.lostFolders[0].path, folder.path("locked"));
  EXPECT_EQ(nothing.totals, ScanTotals());

  access.refuses = true;
  EXPECT_EQ(scan().totals.unreadableFiles, 5u);
}

TEST_F(Scan, LeavesOutFilesThatVanishOrChangeMeanwhile) {
  const std::string first = folder.write("1", bytes(10'000, 'a'));
  const std::string second = folder.write("2", bytes(10'000, 'a'));
  const std::string gone = folder.write("gone", bytes(10'000, 'a'));
  const std::string grows = folder.write("grows", bytes(10'000, 'a'));
  const std::string shrinks = folder.write("shrinks", bytes(10'000, 'a'));
  const std::string touched = folder.write("touched", bytes(10'000, 'a'));
  const std::string replaced = folder.write("replaced", bytes(10'000, 'a'));
  const std::string piped = folder.write("piped", bytes(10'000, 'a'));
  const std::string unwritten = folder.write("unwritten", bytes(10'000, 'a'));
  int pipe = -1;
  std::string content = "for another reader";
  fileSystem.beforeOpen = [&](const std::string& path) {
    if (path == gone) fs::remove(path);
    if (path == replaced) {
      fs::remove(path);
      fs::create_symlink(first, path);
    }
    if (path == piped || path == unwritten) {
      fs::remove(path);
      ASSERT_EQ(::mkfifo(path.c_str(), 0600), 0);
    }
    if (path == piped) {
      pipe = ::open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC);
      ASSERT_EQ(::write(pipe, content.data(), content.size()), std::ssize(content));
    }
  };
  fileSystem.beforeRead = [&](const std::string& path) {
    if (path == grows) std::ofstream(path, std::ios::app) << "more";
    if (path == shrinks) fs::resize_file(path, 100);
    if (path == touched)
      fs::last_write_time(path, fs::file_time_type::clock::now() + std::chrono::hours(1));
  };
  const ScanResult result = scan();
  EXPECT_THAT(paths(result), ElementsAre(ElementsAre(first, second)));
  EXPECT_EQ(result.totals.vanishedFiles, 1u);
  EXPECT_EQ(result.totals.changedFiles, 6u);
  EXPECT_EQ(losses.files.size(), 7u);
  EXPECT_EQ(::read(pipe, content.data(), content.size()), std::ssize(content));
  ::close(pipe);
}

/// Runs the work with every means of the system and without the call that opens a path of many
/// names at once, which the kernel does not know or a sandbox forbids.
void withAndWithoutOpenat2(const std::function<void()>& work) {
  work();
  for (const int failure : {ENOSYS, EPERM})
    Varnel::Tests::onAKernelThatForbids({SYS_openat2}, failure, work);
}

TEST_F(Scan, IsNotLedOutOfTheTreeByALinkInTheMiddle) {
  withAndWithoutOpenat2([&] {
    const ScanFolder base;
    base.write("tree/mid/deep/1", "same");
    base.write("tree/mid/deep/2", "same");
    const std::string alone = base.write("tree/3", "same");
    // The same files outside: nothing but the way tells them apart.
    fs::create_directories(base.path("outside/deep"));
    for (const char* name : {"1", "2"})
      fs::create_hard_link(base.path("tree/mid/deep/") + name, base.path("outside/deep/") + name);
    const auto swap = [&](const std::string& path) {
      // Before any of the two files, for threads may open them in any order.
      if (!path.starts_with(base.path("tree/mid/deep"))) return;
      std::error_code ignored;
      fs::rename(base.path("tree/mid"), base.path("away"), ignored);
      fs::create_directory_symlink(base.path("outside"), base.path("tree/mid"), ignored);
    };
    fileSystem.beforeOpen = swap;
    const ScanResult opened = scan({base.path("tree")});
    EXPECT_THAT(opened.groups, IsEmpty());
    EXPECT_EQ(opened.totals.changedFiles, 2u);

    fs::remove(base.path("tree/mid"));
    fs::rename(base.path("away"), base.path("tree/mid"));
    fileSystem.beforeList = swap;
    const ScanResult listed = scan({base.path("tree")});
    EXPECT_EQ(listed.totals.files, 1u) << "all but " << alone << " lie outside";
    EXPECT_EQ(listed.totals.unreadableFolders, 1u);
    fileSystem.beforeList = nullptr;
    fileSystem.beforeOpen = nullptr;
  });
}

TEST_F(Scan, FindsFilesHoweverLongTheirPathIs) {
  std::string bottom = folder.path();
  // One of the folders has just as many characters as are too many for one call.
  std::string name(1 + (PATH_MAX - 2 - bottom.size()) % 201, 'n');
  int below = ::open(bottom.c_str(), O_RDONLY | O_CLOEXEC);
  for (int depth = 0; depth < 60; ++depth, name.resize(200, 'n')) {
    bottom += "/" + name;
    ASSERT_EQ(::mkdirat(below, name.c_str(), 0700), 0);
    const int next = ::openat(below, name.c_str(), O_RDONLY | O_CLOEXEC);
    ::close(std::exchange(below, next));
  }
  for (const char* file : {"1", "2"}) {
    const int written = ::openat(below, file, O_CREAT | O_WRONLY | O_CLOEXEC, 0600);
    ASSERT_EQ(::write(written, "same", 4), 4);
    ::close(written);
  }
  ::close(below);
  withAndWithoutOpenat2(
      [&] { EXPECT_THAT(paths(scan()), ElementsAre(ElementsAre(bottom + "/1", bottom + "/2"))); });
}

TEST_F(Scan, LosingAFileThatIsComparedLosesNoOther) {
  for (const int lost : {1, 2, 3}) {
    const ScanFolder three;
    std::vector<std::string> left;
    for (const char* name : {"1", "2", "3"}) left.push_back(three.write(name, "same"));
    const std::string victim = three.path(std::to_string(lost));
    std::erase(left, victim);
    std::atomic<int> opened{0};
    fileSystem.beforeOpen = [&](const std::string& path) {
      // The first time is for the digest, the next for a comparison.
      if (path == victim && ++opened == 2) fs::remove(path);
    };
    losses.files.clear();
    EXPECT_THAT(paths(scan({three.path()})), ElementsAre(left));
    EXPECT_THAT(losses.files, ElementsAre(Pair(victim, Loss::Kind::vanished)));
  }
}

TEST_F(Scan, StopsWhenAskedTo) {
  for (int i = 0; i < 100; ++i) folder.write(std::to_string(i) + "/file", "same");
  std::atomic<int> begun{0};
  const auto cancel = [&](const std::string& path) {
    if (path == folder.path()) return;
    ++begun;
    control.isCancelled = true;
  };
  for (auto* const step : {&fileSystem.beforeOpen, &fileSystem.beforeList}) {
    begun = 0;
    control.isCancelled = false;
    *step = cancel;
    (void)scan();
    EXPECT_LE(begun, 4) << "one a thread";
    *step = nullptr;
  }
}

TEST_F(Scan, StopsWithinAFileWhenAskedTo) {
  for (const int files : {2, 3}) {  // Two are compared, three are digested.
    const ScanFolder large;
    for (int i = 0; i < files; ++i)
      fs::resize_file(large.write(std::to_string(i), ""), 1'000'000'000);
    control.isCancelled = false;
    std::atomic<int> blocks{0};
    fileSystem.beforeRead = [&](const std::string&) {
      // Each file's beginning is read for itself first.
      if (++blocks > 2 * files) control.isCancelled = true;
    };
    EXPECT_THAT(paths(scan({large.path()})), IsEmpty()) << "nobody has seen the rest";
    EXPECT_LE(blocks, 20) << files << " files";
  }
}

TEST_F(Scan, PassesOnWhatAWorkerThrows) {
  folder.write("1", "same");
  folder.write("2", "same");
  fileSystem.beforeOpen = [](const std::string&) { throw std::bad_alloc(); };
  EXPECT_THROW((void)scan(), std::bad_alloc);
  OpenAccess::isInside() = false;

  // In the walk too: of one folder, with nothing for the other workers, and of the system's root.
  folder.write("below/3", "same");
  fileSystem.beforeList = [&](const std::string& path) {
    EXPECT_FALSE(path.starts_with("//"));
    if (path != folder.path() && path != "/") throw std::bad_alloc();
  };
  EXPECT_THROW((void)scan(), std::bad_alloc);
  EXPECT_THROW((void)scan({"/"}), std::bad_alloc);
}

/// What the scan must find, by reading everything and looking at nothing else.
std::set<std::set<std::string>> naiveDuplicates(const std::string& root) {
  std::map<std::string, std::set<std::string>> byContent;
  for (const auto& entry : fs::recursive_directory_iterator(root)) {
    if (!entry.is_regular_file() || entry.is_symlink()) continue;
    std::ostringstream content;
    content << std::ifstream(entry.path(), std::ios::binary).rdbuf();
    if (!content.str().empty()) byContent[content.str()].insert(entry.path());
  }
  std::set<std::set<std::string>> groups;
  for (auto& [content, paths] : byContent)
    if (paths.size() > 1) groups.insert(paths);
  return groups;
}

TEST_F(Scan, FindsWhatANaiveSearchFindsWhateverTheTree) {
  std::mt19937 random(20'240'501);
  const auto below = [&](unsigned bound) { return static_cast<unsigned>(random() % bound); };
  for (int round = 0; round < 20; ++round) {
    const ScanFolder tree;
    for (unsigned file = below(150); file > 0; --file) {
      std::string name;
      for (unsigned depth = below(4); depth > 0; --depth) name += std::to_string(below(3)) + "d/";
      // Few sizes around the boundaries and few differences make many near misses.
      constexpr std::size_t sizes[] = {0, 1, 4096, 4097, 9000};
      std::string content(sizes[below(5)], 'x');
      if (!content.empty() && below(2) == 0) content[below(2) * (content.size() - 1)] = 'y';
      tree.write(name + std::to_string(file), content);
    }
    std::set<std::set<std::string>> found;
    const ScanResult result = scan({tree.path()});
    for (const DuplicateGroup& group : result.groups)
      found.emplace(group.paths.begin(), group.paths.end());
    ASSERT_EQ(found, naiveDuplicates(tree.path())) << "round " << round;
    ASSERT_EQ(scan({tree.path()}).groups, result.groups) << "the order depends on the threads";
  }
}

}  // namespace
}  // namespace Orvane::Testing
