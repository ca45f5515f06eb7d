// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <fstream>
#include <map>
#include <random>
#include <set>
#include <sstream>

#include <Scan/Candidate.h>
#include <Tests/Programs/ScanFixture.h>
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

using Scan = ScanFixture;

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
    EXPECT_TRUE(scan().isPartial);
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
      constexpr std::size_t block = headLength + 256 * 1024;
      constexpr std::size_t sizes[] = {0,      1,      headLength - 1, headLength, headLength + 1,
                                       20'000, 20'000, block,          block + 1,  1'100'000};
      std::string content(sizes[below(10)], 'x');
      if (!content.empty() && below(2) == 0) content[below(3) * (content.size() - 1) / 2] = 'y';
      tree.write(name + "d" + std::to_string(file), content);
    }
    turns.disk = {.places = 1 + below(3), .isOrdered = below(3) > 0};
    turns.stepsPerTurn = below(2) == 0 ? 1 : 20;
    std::set<std::set<std::string>> found;
    const ScanResult result = scan({tree.path()});
    EXPECT_TRUE(
        std::ranges::is_sorted(result.groups, std::greater(), &DuplicateGroup::wastedBytes));
    for (const std::vector<std::string>& group : paths(result)) {
      EXPECT_TRUE(std::is_sorted(group.begin(), group.end()));
      found.emplace(group.begin(), group.end());
    }
    ASSERT_EQ(found, naiveDuplicates(tree.path())) << "round " << round;
    turns.disk = {.places = 4, .isOrdered = false};
    const std::vector<std::string> nested{tree.path("d/d0"), tree.path(), tree.path("d"),
                                          tree.path()};
    const bool areThere = fs::exists(nested[0]);
    const ScanResult again = areThere ? scan(nested) : scan({tree.path()});
    ASSERT_EQ(paths(again), paths(result)) << "the order depends on how the disk is read";
    ASSERT_EQ(again.totals, result.totals) << "a folder was walked twice";
  }
}

}  // namespace
}  // namespace Orvane::Testing
