// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <climits>
#include <csignal>
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
extern "C" ssize_t getdents64(int folder, void* buffer, size_t length) noexcept {
  static const auto real =
      reinterpret_cast<decltype(&getdents64)>(::dlsym(RTLD_NEXT, "getdents64"));
  const ssize_t size = real(folder, buffer, length);
  for (ssize_t at = 0; hidesKinds && at < size;) {
    auto* const entry = reinterpret_cast<dirent64*>(static_cast<char*>(buffer) + at);
    entry->d_type = DT_UNKNOWN;
    at += entry->d_reclen;
  }
  return size;
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
    ScanResult result = DuplicateFinder({fileSystem, turns, losses}).find(folders, control);
    turns.join();
    return result;
  }
  ScanResult scan() { return scan({folder.path()}); }

  static Groups paths(const ScanResult& result) {
    Groups groups;
    for (const DuplicateGroup& group : result.groups) groups.push_back(result.pathsOf(group));
    return groups;
  }

  void TearDown() override {
    EXPECT_EQ(fileSystem.faults, 0) << "content was read outside a turn";
    EXPECT_EQ(fileSystem.openFolders, 0);
  }

  ScanFolder folder;
  FaultyFileSystem fileSystem;
  FakeTurns turns;
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
  const ScanResult result = scan();
  EXPECT_THAT(paths(result), ::testing::UnorderedElementsAreArray(expected));
  EXPECT_TRUE(std::is_sorted(result.groups.begin(), result.groups.end(),
                             [](const DuplicateGroup& a, const DuplicateGroup& b) {
                               return a.wastedBytes() > b.wastedBytes();
                             }));
}

TEST_F(Scan, CountsEveryKindOfFileOnce) {
  // The folder that was made first is mostly walked first, yet its link is not the first path.
  const std::string original = folder.write("b/original", "content");
  const std::string copy = folder.write("b/deep/er/copy", "content");
  fs::create_directory(folder.path("a"));
  fs::create_hard_link(original, folder.path("a/link"));
  fs::create_symlink(original, folder.path("symlink"));
  fs::create_directory_symlink(folder.path("b"), folder.path("symlinked"));
  folder.write("empty1", "");
  folder.write("empty2", "");
  fs::create_hard_link(folder.write("alone", "other"), folder.path("alone-again"));

  ScanTotals expected;
  expected.folders = 5;
  expected.files = 7;
  expected.bytes = 19;
  expected.emptyFiles = 2;
  expected.hardLinks = 2;
  expected.duplicateFiles = 1;
  expected.wastedBytes = 7;
  for (const bool areHidden : {true, false}) {
    hidesKinds = areHidden;
    const ScanResult result = scan();
    EXPECT_THAT(paths(result), ElementsAre(ElementsAre(folder.path("a/link"), copy)));
    EXPECT_EQ(result.totals, expected);
  }
}

TEST_F(Scan, WalksOverlappingFoldersOnce) {
  folder.write("one/a", "same");
  for (const char* name : {"one/two/b", "one/two/z/c", "one/two!/d", "one/zoo/e", "f", "x"})
    folder.write(name, "same");
  const ScanResult once = scan();
  const ScanResult twice =
      scan({folder.path("one/two"), folder.path(), folder.path("one"), folder.path("one/two!"),
            folder.path("one/two/z"), folder.path("one/zoo"), folder.path()});
  EXPECT_EQ(paths(twice), paths(once));
  EXPECT_EQ(twice.totals, once.totals);
}

TEST_F(Scan, DoesNotEnterAFolderBelowItself) {
  folder.write("one/again/a", "same");
  folder.write("one/b", "same");
  fileSystem.identities = {{folder.path("one"), {1, 2}}, {folder.path("one/again"), {1, 2}}};
  EXPECT_EQ(scan().totals.folders, 2u);
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
  fileSystem.folderFaults[folder.path("locked")] = std::errc::permission_denied;

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

  // The disk is on no known volume, or goes away.
  turns.disk.isReadable = false;
  EXPECT_EQ(scan().totals.unreadableFiles, 5u);
  turns.disk.isReadable = turns.refuses = true;
  EXPECT_THAT(scan().lostFolders, ::testing::SizeIs(1));
}

TEST_F(Scan, LeavesOutFilesThatVanishOrChangeMeanwhile) {
  const std::string first = folder.write("1", bytes(10'000, 'a'));
  const std::string second = folder.write("2", bytes(10'000, 'a'));
  const std::string gone = folder.write("gone", bytes(10'000, 'a'));
  const std::string grows = folder.write("grows", bytes(10'000, 'a'));
  const std::string shrinks = folder.write("shrinks", bytes(10'000, 'a'));
  const std::string touched = folder.write("touched", bytes(10'000, 'a'));
  const std::string replaced = folder.write("replaced", bytes(10'000, 'a'));
  const std::string foldered = folder.write("foldered", bytes(10'000, 'a'));
  const std::string piped = folder.write("piped", bytes(10'000, 'a'));
  const std::string unwritten = folder.write("unwritten", bytes(10'000, 'a'));
  const std::string swapped = folder.write("swapped", bytes(10'000, 'a'));
  const ScanFolder elsewhere;
  const std::string twin = elsewhere.write("twin", bytes(10'000, 'a'));
  int pipe = -1;
  std::string content = "for another reader";
  fileSystem.beforeOpen = [&](const std::string& path) {
    if (path == gone) fs::remove(path);
    if (path == swapped) {
      fs::last_write_time(twin, fs::last_write_time(path));
      fs::rename(twin, path);
    }
    if (path == replaced) {
      fs::remove(path);
      fs::create_symlink(first, path);
    }
    if (path == foldered) {
      fs::remove(path);
      fs::create_directory(path);
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
  EXPECT_EQ(result.totals.changedFiles, 8u);
  EXPECT_EQ(losses.files.size(), 9u);
  EXPECT_EQ(::read(pipe, content.data(), content.size()), std::ssize(content));
  ::close(pipe);
}

std::atomic<int> leased{-1};

TEST_F(Scan, WaitsForALeaseToBeGivenBack) {
  const std::string first = folder.write("1", "same");
  const std::string second = folder.write("2", "same");
  leased = ::open(second.c_str(), O_RDWR | O_CLOEXEC);
  struct sigaction giveBack {
  }, before{};
  giveBack.sa_handler = [](int) { ::fcntl(leased, F_SETLEASE, F_UNLCK); };
  ::sigaction(SIGIO, &giveBack, &before);
  const bool hasLeases = ::fcntl(leased, F_SETLEASE, F_WRLCK) == 0;
  EXPECT_THAT(paths(scan()), ElementsAre(ElementsAre(first, second)));
  ::sigaction(SIGIO, &before, nullptr);
  ::close(leased);
  if (!hasLeases) GTEST_SKIP() << "the file system of temporary files grants no leases";
}

/// How many pages of the file are in the system's cache.
long cachedPages(const std::string& path) {
  const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  const std::size_t size = fs::file_size(path);
  std::vector<unsigned char> pages((size + 4095) / 4096);
  void* const mapped = ::mmap(nullptr, size, PROT_READ, MAP_SHARED, file, 0);
  EXPECT_EQ(::mincore(mapped, size, pages.data()), 0);
  ::munmap(mapped, size);
  ::close(file);
  return std::count_if(pages.begin(), pages.end(), [](auto page) { return page & 1; });
}

TEST_F(Scan, LeavesThePageCacheAloneWhereItShould) {
  const std::vector<std::string> files = {folder.write("1", bytes(1'000'000, 'a')),
                                          folder.write("2", bytes(1'000'000, 'a'))};
  for (const std::string& path : files) {
    const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    ::fsync(file);
    ::posix_fadvise(file, 0, 0, POSIX_FADV_DONTNEED);
    ::close(file);
    if (cachedPages(path) > 0) GTEST_SKIP() << "their file system is a cache itself";
  }
  const auto scanAs = [&](CacheUse use) {
    const ScanResult result =
        DuplicateFinder({systemFileSystem(use), turns, losses}).find({folder.path()}, control);
    EXPECT_THAT(paths(result), ElementsAre(files));
    return cachedPages(files[0]) + cachedPages(files[1]);
  };
  EXPECT_EQ(scanAs(CacheUse::traceless), 0);
  EXPECT_EQ(scanAs(CacheUse::normal), 2 * 245);
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
    // The first time is for the walk, the next for reading.
    for (const int swapAt : {1, 2}) {
      std::atomic<int> opened{0};
      fileSystem.beforeOpenFolder = [&](const std::string& path) {
        if (path != base.path("tree/mid/deep") || ++opened != swapAt) return;
        fs::rename(base.path("tree/mid"), base.path("away"));
        fs::create_directory_symlink(base.path("outside"), base.path("tree/mid"));
      };
      // Down from a folder that is still open, the way would be without the link.
      fileSystem.maxOpenFolders = 1;
      turns.disk.places = 1;
      const ScanResult result = scan({base.path("tree")});
      EXPECT_THAT(result.groups, IsEmpty());
      EXPECT_EQ(result.totals.unreadableFolders, swapAt == 1 ? 1u : 0u);
      EXPECT_EQ(result.totals.changedFiles, swapAt == 1 ? 0u : 2u) << "all but " << alone;
      fs::remove(base.path("tree/mid"));
      fs::rename(base.path("away"), base.path("tree/mid"));
    }
    fileSystem.beforeOpenFolder = nullptr;
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

TEST_F(Scan, LosingAFileAtALaterLookLosesNoOther) {
  for (const int lost : {1, 2, 3}) {
    const ScanFolder three;
    std::vector<std::string> left;
    for (const char* name : {"1", "2", "3"}) left.push_back(three.write(name, bytes(9000, 'a')));
    const std::string victim = three.path(std::to_string(lost));
    std::erase(left, victim);
    std::atomic<int> opened{0};
    fileSystem.beforeOpen = [&](const std::string& path) {
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
  for (auto* const step : {&fileSystem.beforeOpen, &fileSystem.beforeOpenFolder}) {
    begun = 0;
    control.isCancelled = false;
    *step = cancel;
    EXPECT_FALSE(scan().tree);
    EXPECT_LE(begun, 4) << "one a task";
    *step = nullptr;
  }
}

TEST_F(Scan, StopsWithinAFolderWhenAskedTo) {
  for (int i = 0; i < 1000; ++i) folder.write(std::to_string(i), "same");
  int times = 0;
  fileSystem.beforeList = [&](const std::string&) { control.isCancelled = ++times == 2; };
  (void)scan();
  EXPECT_LE(control.filesFound, 64u);
  EXPECT_EQ(control.filesToRead, 0u) << "nobody asks for them any more";
}

TEST_F(Scan, StopsWithinAFileWhenAskedTo) {
  for (int i = 0; i < 3; ++i) fs::resize_file(folder.write(std::to_string(i), ""), 1'000'000'000);
  std::atomic<int> blocks{0};
  fileSystem.beforeRead = [&](const std::string&) {
    // Each file's beginning, middle and end are read first.
    if (++blocks > 10) control.isCancelled = true;
  };
  EXPECT_THAT(paths(scan()), IsEmpty()) << "nobody has seen the rest";
  EXPECT_LE(blocks, 20);
}

TEST_F(Scan, PassesOnWhatATaskThrows) {
  folder.write("1", "same");
  folder.write("2", "same");
  fileSystem.beforeOpen = [](const std::string&) { throw std::bad_alloc(); };
  EXPECT_THROW((void)scan(), std::bad_alloc);
  turns.join();

  // In the walk too: of one folder, with nothing for the other tasks, and of the system's root.
  folder.write("below/3", "same");
  fileSystem.beforeOpenFolder = [&](const std::string& path) {
    EXPECT_FALSE(path.starts_with("//"));
    if (path != folder.path() && path != "/") throw std::bad_alloc();
  };
  EXPECT_THROW((void)scan(), std::bad_alloc);
  turns.join();
  EXPECT_THROW((void)scan({"/"}), std::bad_alloc);
  turns.join();
}

using Reading = FaultyFileSystem::Reading;

TEST_F(Scan, ReadsADiskThatMustWorkByPlaceAndEverythingOnce) {
  turns.disk = {.places = 1, .isOrdered = true};
  turns.stepsPerTurn = 1;
  std::vector<Reading> expected;
  for (const int place : {5, 1, 7, 3, 2, 6, 4}) {
    const std::string path =
        folder.write(std::to_string(place), bytes(10'000, place < 4 ? 'a' : 'b'));
    fileSystem.places[path] = static_cast<std::uint64_t>(place);
  }
  for (const auto& [path, place] : fileSystem.places) expected.push_back({path, 0, 10'000});
  EXPECT_THAT(paths(scan()), ::testing::SizeIs(2));
  // The first file shows that the disk must work: of that one only, the head was read before.
  ASSERT_EQ(fileSystem.readings.size(), 8u);
  const Reading first = fileSystem.readings.front();
  EXPECT_EQ(first.length, 4096u);
  fileSystem.readings.erase(fileSystem.readings.begin());
  std::erase_if(expected, [&](const Reading& reading) { return reading.path == first.path; });
  expected.push_back({first.path, 0, 10'000});
  EXPECT_EQ(fileSystem.readings, expected);

  // Where places cannot be told, inodes stand for them, and the question is soon given up.
  fileSystem.places = {{"nowhere", 1}};
  fileSystem.readings.clear();
  fileSystem.placesAsked = 0;
  for (int i = 10; i < 30; ++i) folder.write(std::to_string(i), bytes(10'000, 'a'));
  EXPECT_THAT(paths(scan()), ::testing::SizeIs(2));
  EXPECT_EQ(fileSystem.readings.size(), 28u);
  EXPECT_EQ(fileSystem.placesAsked, 8 + 1) << "the first file's rest is a look of its own";
}

TEST_F(Scan, NeverReadsTwoLargeFilesOfAnOrderedDiskByTurns) {
  turns.disk = {.places = 2, .isOrdered = true};
  turns.stepsPerTurn = 7;
  std::vector<std::string> equal;
  for (const char* name : {"1", "2", "3"})
    equal.push_back(folder.write(name, bytes(12'000'000, 'a')));
  EXPECT_THAT(paths(scan()), ElementsAre(equal));
  std::erase_if(fileSystem.readings, [](const Reading& reading) { return reading.length <= 4096; });
  std::uint64_t total = 0;
  for (std::size_t i = 0; i < fileSystem.readings.size(); ++i) {
    const Reading& reading = fileSystem.readings[i];
    total += reading.length;
    EXPECT_TRUE(reading.offset == 0 || reading.path == fileSystem.readings[i - 1].path);
  }
  EXPECT_EQ(total, 36'000'000u) << "everything is read once";
}

TEST_F(Scan, TellsLargeFilesApartByTheirMiddleOrEnd) {
  for (const std::size_t place : {5'000'000u, 9'999'999u}) {
    const ScanFolder large;
    for (const char letter : {'a', 'b', 'c'}) {
      std::string content(10'000'000, 'x');
      content[place] = letter;
      large.write(std::string(1, letter), content);
    }
    control.bytesRead = 0;
    EXPECT_THAT(paths(scan({large.path()})), IsEmpty());
    EXPECT_EQ(control.bytesRead, 3u * 3 * 4096);
  }
}

TEST_F(Scan, DoesWithFewDescriptors) {
  turns.disk.places = 1;
  const std::string first = folder.write("a/b/c/1", "same");
  const std::string second = folder.write("a/d/2", "same");
  for (int* const max : {&fileSystem.maxOpenFolders, &fileSystem.maxFoldersBesideAFile}) {
    const int many = std::exchange(*max, 1);
    EXPECT_THAT(paths(scan()), ElementsAre(ElementsAre(first, second)));
    *max = many;
  }
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
    for (unsigned file = below(100); file > 0; --file) {
      std::string name;
      // What follows a name in a path decides on its order.
      constexpr const char* names[] = {"d/", "d-/", "d0/"};
      for (unsigned depth = below(4); depth > 0; --depth) name += names[below(3)];
      // Few sizes around the boundaries and few differences make many near misses.
      constexpr std::size_t sizes[] = {0, 1, 4096, 4097, 9000, 9000, 9000, 300'000, 1'100'000};
      std::string content(sizes[below(9)], 'x');
      if (!content.empty() && below(2) == 0) content[below(3) * (content.size() - 1) / 2] = 'y';
      tree.write(name + "d" + std::to_string(file), content);
    }
    turns.disk = {.places = 1 + below(3), .isOrdered = below(3) > 0};
    turns.stepsPerTurn = below(2) == 0 ? 1 : 20;
    std::set<std::set<std::string>> found;
    const ScanResult result = scan({tree.path()});
    for (const std::vector<std::string>& group : paths(result)) {
      EXPECT_TRUE(std::is_sorted(group.begin(), group.end()));
      found.emplace(group.begin(), group.end());
    }
    ASSERT_EQ(found, naiveDuplicates(tree.path())) << "round " << round;
    turns.disk = {.places = 4, .isOrdered = false};
    const std::vector<std::string> nested{tree.path(), tree.path("d"), tree.path("d/d0")};
    const bool areThere = fs::exists(nested[2]);
    const ScanResult again = areThere ? scan(nested) : scan({tree.path()});
    ASSERT_EQ(paths(again), paths(result)) << "the order depends on how the disk is read";
  }
}

}  // namespace
}  // namespace Orvane::Testing
