// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <map>
#include <set>
#include <sstream>

#include <Scan/Candidate.h>
#include <Tests/Programs/ScanFixture.h>
#include <Tests/Support/DiskImage.h>
#include <Tests/Support/MountNamespace.h>

namespace Orvane::Testing {
namespace {

using ScanResults = ScanFixture;
using ::testing::SizeIs;

TEST_F(ScanResults, HoldWhatWasComparedBeforeTheScanWasCancelled) {
  // Pairs of one size; the later looks are of no use to those of the first.
  for (const std::size_t size : {std::size_t{100}, std::size_t{2 * headLength}}) {
    const ScanFolder pairs;
    for (const char content : {'a', 'b', 'c', 'd'})
      for (const char* name : {"1", "2"})
        pairs.write(content + std::string(name), bytes(size, content));
    turns.disk.places = 1;
    for (int last = 1; last < 20; ++last) {
      control.isCancelled = false;
      std::map<std::string, int> opened;
      int count = 0;
      fileSystem.beforeOpen = [&](const std::string& path) {
        ++opened[path];
        control.isCancelled = ++count == last || control.isCancelled;
      };
      const ScanResult result = scan({pairs.path()});
      EXPECT_EQ(result.isPartial, control.isCancelled);
      EXPECT_EQ(result.totals.files, 8u);
      const int needed = size > headLength ? 2 : 1;
      std::size_t pairsRead = 0, unreached = 0;
      for (const char content : {'a', 'b', 'c', 'd'}) {
        int read = 0;
        for (const char* name : {"1", "2"})
          if (opened[pairs.path(content + std::string(name))] == needed) ++read;
        if (read == 2) ++pairsRead;
        unreached += static_cast<std::size_t>(2 - read);
      }
      EXPECT_THAT(result.groups, SizeIs(pairsRead)) << last;
      // Of the only head that was read there is nothing more to see.
      EXPECT_EQ(result.totals.unreachedFiles, last == 1 ? 7u : unreached) << last;
      for (const auto& group : paths(result)) {
        EXPECT_THAT(group, SizeIs(2));
        EXPECT_EQ(group[0].back(), '1');
        EXPECT_EQ(group[1], group[0].substr(0, group[0].size() - 1) + "2");
      }
    }
  }
}

TEST_F(ScanResults, TellTheStateAndTheNamesOfEachFile) {
  const std::string first = folder.write("b", "same");
  const std::string second = folder.write("c", "same");
  fs::create_hard_link(second, folder.path("z"));
  fs::create_hard_link(second, folder.path("a"));
  const timespec moment[] = {{0, UTIME_OMIT}, {-1, 250'000'000}};
  ASSERT_EQ(::utimensat(AT_FDCWD, first.c_str(), moment, 0), 0);
  const ScanResult result = scan();
  ASSERT_THAT(result.groups, SizeIs(1));
  const std::vector<DuplicateFile> files = result.filesOf(result.groups[0]);
  ASSERT_THAT(files, SizeIs(2));
  EXPECT_EQ(files[0].path, folder.path("a"));
  EXPECT_THAT(files[0].names, ElementsAre(second, folder.path("z")));
  EXPECT_EQ(files[1].path, first);
  EXPECT_THAT(files[1].names, IsEmpty());
  EXPECT_EQ(files[1].modifiedAt, -750'000'000);
  struct stat facts;
  ASSERT_EQ(::stat(first.c_str(), &facts), 0);
  EXPECT_EQ(files[1].identity, (FileIdentity{facts.st_dev, facts.st_ino}));
}

// Each file is "full", all "hole", has a name "outside", or a place that it shares with others.
TEST_F(ScanResults, CountAsWasteWhatRemovalFrees) {
  constexpr std::uint64_t size = 1 << 20;
  const struct {
    std::vector<std::string> files;
    std::uint64_t wastedBytes;
  } cases[] = {
      {{"full", "full", "full"}, 2 * size},
      {{"full", "hole"}, size},
      {{"hole", "hole"}, 0},
      {{"full", "outside"}, size},
      {{"full", "full", "outside"}, 2 * size},
      {{"outside", "outside"}, 0},
      {{"1", "1", "1"}, 0},
      {{"1", "1", "2", "2"}, size},
      {{"1", "1", "full"}, size},
      {{"1", "2"}, 0},  // Shared with others than one another.
      {{"1", "2", "full"}, size},
      {{"1", "2", "full", "full"}, 2 * size},
  };
  const ScanFolder elsewhere;
  for (const auto& [files, wastedBytes] : cases) {
    const ScanFolder tree;
    fileSystem.shared.clear();
    for (std::size_t i = 0; i < files.size(); ++i) {
      const std::string name = std::to_string(i);
      const std::string path = tree.write(name, files[i] == "hole" ? "" : std::string(size, '\0'));
      fs::resize_file(path, size);
      if (files[i] == "outside")
        fs::create_hard_link(path,
                             elsewhere.path(fs::path(tree.path()).filename().string() + name));
      if (std::isdigit(files[i][0])) fileSystem.shared[path] = {size, std::stoull(files[i])};
    }
    const ScanResult result = scan({tree.path()});
    ASSERT_THAT(result.groups, SizeIs(1));
    EXPECT_EQ(result.groups[0].wastedBytes, wastedBytes) << ::testing::PrintToString(files);
    EXPECT_EQ(result.totals.wastedBytes, wastedBytes);
    EXPECT_EQ(result.totals.duplicateFiles, files.size() - 1);
  }
}

/// Makes a file that shares all extents of another one.
bool share(const std::string& path, const std::string& other) {
  const int from = ::open(other.c_str(), O_RDONLY | O_CLOEXEC);
  const int file = ::open(path.c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0600);
  const bool isShared = ::ioctl(file, FICLONE, from) == 0;
  ::close(file);
  ::close(from);
  return isShared;
}

// What the file systems themselves tell, in a mount of each.
TEST_F(ScanResults, KnowWhichExtentsFilesShare) {
  static const std::string reason = Varnel::Tests::enterMountNamespace();
  if (!reason.empty()) GTEST_SKIP() << reason;
  unsigned tried = 0;
  for (const auto& kind : {Varnel::Tests::DiskImage::xfs(), Varnel::Tests::DiskImage::btrfs()}) {
    const Varnel::Tests::DiskImage image(folder.path(kind.name), kind);
    const ScanFolder mounted;
    if (image.name().empty() || !image.mount(mounted.path())) continue;
    ++tried;
    constexpr std::size_t size = 200'000;
    for (const char* name : {"in/1", "in/2", "out/1"}) mounted.write(name, bytes(size, *name));
    fs::create_directory(mounted.path("copies"));
    Varnel::Tests::synchronise(mounted.path());
    EXPECT_EQ(scan({mounted.path("in")}).totals.wastedBytes, size);
    EXPECT_TRUE(share(mounted.path("copies/1"), mounted.path("in/1")));
    EXPECT_EQ(scan({mounted.path("in"), mounted.path("copies")}).totals.wastedBytes, size);
    // Both are held from outside now.
    EXPECT_TRUE(share(mounted.path("copies/2"), mounted.path("in/2")));
    EXPECT_EQ(scan({mounted.path("in")}).totals.wastedBytes, 0u);
    EXPECT_EQ(scan({mounted.path("in"), mounted.path("copies")}).totals.wastedBytes, size);
    EXPECT_EQ(::umount(mounted.path().c_str()), 0);
  }
  if (tried == 0) GTEST_SKIP() << "no mkfs.xfs, no mkfs.btrfs, or no loop devices";
}

/// "a/x=1 a/y=2": files and their contents. "a/l@x" is a symbolic link, "b/x:a/x" a hard link,
/// "a/e/" a folder, and "a/x!" a file that cannot be read.
void makeTree(const std::string& description, const ScanFolder& tree,
              FaultyFileSystem& fileSystem) {
  std::istringstream words(description);
  for (std::string word; words >> word;) {
    const std::size_t mark = word.find_first_of("=@:!");
    const std::string name = word.substr(0, mark),
                      value = word.substr(std::min(mark, word.size() - 1) + 1);
    fs::create_directories(fs::path(tree.path(name)).parent_path());
    if (mark == std::string::npos) continue;
    if (word[mark] == '@') fs::create_symlink(value, tree.path(name));
    if (word[mark] == ':') fs::create_hard_link(tree.path(value), tree.path(name));
    if (word[mark] == '=') tree.write(name, value);
    if (word[mark] == '!') fileSystem.openFaults[tree.write(name, "1")] = std::errc::io_error;
  }
}

TEST_F(ScanResults, NameTheLargestFoldersThatHoldTheSame) {
  const struct {
    std::string tree;
    std::string groups;   ///< Of folders; "a,b c,d" are two.
    std::size_t implied;  ///< Groups of files that they say.
  } cases[] = {
      {"a/x=1 b/x=1", "a,b", 1},
      {"a/x=1 b/y=1", "", 0},
      {"a/x=1 a/y=22 b/x=22 b/y=1", "", 0},
      {"a/x=1 b/x=1 b/y=2", "", 0},
      {"a/s/x=1 b/s/x=1", "a,b", 1},
      {"a/s/x=1 a/y=2 b/s/x=1 b/z=3", "a/s,b/s", 1},
      {"a/s/x=1 b/s/x=1 c/s/x=1 c/y=2", "a/s,b/s,c/s a,b", 1},
      {"a/s/x=1 a/t/x=1 b/s/x=1 b/t/x=1", "a/s,a/t,b/s,b/t a,b", 1},
      {"a/x=1 a/y=1 b/x=1 b/y=1", "a,b", 0},
      {"a/x=1 b/x=1 c/y=1", "a,b", 0},
      {"a/x=1 a/e/ b/x=1", "", 0},
      {"a/x=1 a/e/ b/x=1 b/e/", "a,b", 1},
      {"a/x=1 a/e= b/x=1 b/e=", "a,b", 1},
      {"a/x=1 a/e= b/x=1", "", 0},
      {"a/e= b/e= c/ d/", "", 0},
      {"a/x=1 b/x=1 a/l@x b/l@x", "", 0},
      {"a/x=1 b/x=1 a/s/y=2 b/s/y=2 a/s/l@y b/s/l@y", "", 0},
      {"a/x=1 b/x=1 a/y! b/y!", "", 0},
      {"a/x=1 b/x:a/x", "a,b", 0},
      {"a/x=1 b/x:a/x c/x=1", "a,b,c", 1},
      {"a/x=1 a/y=22 b/x=1 b/y:a/y", "a,b", 1},
      {"a/x=1 b/x=1 c/x=4444 d/x=4444 d/s/y=55 e/s/y=55", "d/s,e/s a,b", 2},
      {"a/x=1 b/x=1 c/s/x=4444 d/s/x=4444 e/f/y=55 g/h/f/y=55", "c,d e,g/h a,b", 3},
  };
  for (const auto& [description, groups, implied] : cases) {
    const ScanFolder tree;
    makeTree(description, tree, fileSystem);
    const ScanResult result = scan({tree.path()});
    std::string found;
    for (const FolderGroup& group : result.folderGroups) {
      found += found.empty() ? "" : " ";
      for (const std::string& path : result.pathsOf(group))
        found +=
            (found.empty() || found.back() == ' ' ? "" : ",") + path.substr(tree.path().size() + 1);
    }
    EXPECT_EQ(found, groups) << description;
    EXPECT_EQ(std::ranges::count_if(result.groups,
                                    [&](const auto& group) { return result.isImplied(group); }),
              static_cast<std::ptrdiff_t>(implied))
        << description;
  }
}

TEST_F(ScanResults, NameNoFolderThatWasNotListedToItsEnd) {
  fs::create_directory(folder.path("b"));
  std::map<ino_t, std::string> names;
  for (int i = 10; i <= 42; ++i) {  // One more than are listed at once.
    const std::string name = std::to_string(i);
    fs::create_hard_link(folder.write("a/" + name, name), folder.path("b/" + name));
    struct stat facts {};
    EXPECT_EQ(::stat(folder.path("b/" + name).c_str(), &facts), 0);
    names[facts.st_ino] = name;
  }
  std::string whole;
  fileSystem.beforeList = [&](const std::string& path) {
    if (path == folder.path() || path == whole) return;
    control.isCancelled = !whole.empty();
    if (whole.empty()) fs::remove((whole = path) + "/" + names.rbegin()->second);
  };
  turns.disk.places = 1;
  EXPECT_THAT(scan().folderGroups, IsEmpty());
  EXPECT_TRUE(control.isCancelled);
}

}  // namespace
}  // namespace Orvane::Testing
