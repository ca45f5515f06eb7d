// SPDX-License-Identifier: MIT
#include <clocale>
#include <mutex>

#include <Scan/Glob.h>
#include <Tests/Programs/ScanFixture.h>

namespace Orvane::Testing {
namespace {

TEST(Glob, MatchesAsDocumented) {
  const struct {
    const char* pattern;
    std::vector<std::string> matching;
    std::vector<std::string> others;
  } cases[] = {
      {"*.jpg", {"a.jpg", ".jpg", "\xff.jpg"}, {"a.jpeg", "a.jpg~"}},
      {"?", {"a", "\xC3\xA4", "\xff"}, {"ab", ""}},
      {"[a-c]\\*", {"a*", "c*"}, {"ab", "d*"}},
      {"[!.]*", {"a"}, {".a"}},
      {"[", {"["}, {"a"}},
      {"**", {"", "a"}, {}},
      {"/a/*/c", {"/a/b/c", "/a/.b/c"}, {"/a/c", "/a/b/b/c", "/x/a/b/c", "/a/b/c/d"}},
      {"a/b", {"/a/b", "/x/y/a/b"}, {"/a/b/c", "/xa/b", "/a/x/b"}},
      {"/a/**/z", {"/a/z", "/a/b/z", "/a/z/b/z"}, {"/a", "/z", "/a/z/b"}},
      {"**/a/**/b/*.o", {"/a/b/1.o", "/x/a/y/a/z/b/1.o"}, {"/a/1.o", "/b/a/1.o", "/a/b/c/1.o"}},
      {"cache/", {"/cache/a", "/x/cache/a/b"}, {"/cache", "/x/caches/a"}},
      {"/srv/**", {"/srv/a", "/srv/a/b"}, {"/srv", "/srvx/a"}},
      {"/", {"/a", "/a/b"}, {}},
  };
  const auto matches = [](const Glob& glob, const std::string& text) {
    return glob.isForPaths() ? glob.matchesPath(text, Glob::Kind::file) : glob.matchesName(text);
  };
  // Whatever the host has made of its locale.
  for (const char* locale : {"C", "C.UTF-8"}) {
    std::setlocale(LC_ALL, locale);
    for (const auto& [pattern, matching, others] : cases) {
      const Glob glob(pattern);
      for (const std::string& text : matching) EXPECT_TRUE(matches(glob, text)) << pattern << text;
      for (const std::string& text : others) EXPECT_FALSE(matches(glob, text)) << pattern << text;
    }
  }
  std::setlocale(LC_ALL, "C");
  EXPECT_TRUE(Glob("cache/").matchesPath("/x/cache", Glob::Kind::folder));
}

class ScanChoice : public ScanFixture {
 protected:
  /// Files that are all equal.
  void writeAll(const std::vector<std::string>& names) {
    for (const std::string& name : names) folder.write(name, "same");
  }

  /// The names of the files in the one group of a scan.
  std::vector<std::string> found(ScanRequest request) {
    if (request.folders.empty() && request.files.empty()) request.folders = {folder.path()};
    const ScanResult result = scan(request);
    if (result.groups.empty()) return {};
    EXPECT_EQ(result.groups.size(), 1u);
    std::vector<std::string> names = result.pathsOf(result.groups[0]);
    EXPECT_TRUE(std::is_sorted(names.begin(), names.end()));
    EXPECT_EQ(names.size(), result.totals.files);
    for (std::string& name : names) name.erase(0, folder.path().size() + 1);
    return names;
  }
};

TEST_F(ScanChoice, TakesTheFilesThatAreAskedFor) {
  writeAll({"1.jpg", "2.txt", ".hidden/3.jpg", ".4.jpg", "sub/5.jpg", "sub/cache/6.jpg"});
  folder.write("large1", "a larger one");
  folder.write("large2", "a larger one");
  const struct {
    ScanRequest request;
    std::vector<std::string> names;
  } cases[] = {
      {{.maxSize = 4, .include = {"*.txt", "?.jpg"}, .exclude = {"sub"}, .skipsHidden = true},
       {"1.jpg", "2.txt"}},
      {{.include = {"*.jpg"}, .skipsHidden = true}, {"1.jpg", "sub/5.jpg", "sub/cache/6.jpg"}},
      {{.minSize = 5}, {"large1", "large2"}},
      {{.maxSize = 4, .exclude = {"*.jpg"}}, {}},
      {{.include = {"sub/"}}, {"sub/5.jpg", "sub/cache/6.jpg"}},
      {{.include = {"*.jpg"}, .exclude = {".*", folder.path("*/cache")}}, {"1.jpg", "sub/5.jpg"}},
      {{.folders = {folder.path(".hidden"), folder.path("sub")},
        .exclude = {"sub", "cache/"},
        .skipsHidden = true},
       {".hidden/3.jpg", "sub/5.jpg"}},
  };
  for (const auto& [request, names] : cases) EXPECT_EQ(found(request), names);
  std::mutex mutex;
  std::vector<std::string> entered;
  fileSystem.beforeOpenFolder = [&](const std::string& path) {
    const std::lock_guard lock(mutex);
    entered.push_back(path);
  };
  EXPECT_THAT(found({.exclude = {"sub/cache/", ".*", "large?"}}),
              ElementsAre("1.jpg", "2.txt", "sub/5.jpg"));
  for (const std::string& path : entered)
    EXPECT_FALSE(path.ends_with("cache") || path.ends_with(".hidden")) << path;
}

TEST_F(ScanChoice, TakesSingleFilesOnceWhateverElseIsScanned) {
  writeAll({"a/1", "a/2", "a/.3", "a/sub/4", "a/sub/5"});
  fs::create_symlink("1", folder.path("a/link"));
  ScanRequest request{.files = {{folder.path("a"), {"2", "missing", ".3", "2", "sub", "link"}},
                                {folder.path("a/sub"), {"4"}},
                                {folder.path("gone"), {"7"}}},
                      .maxSize = 4};
  const auto expectFound = [&](std::vector<std::string> names, std::uint64_t folders) {
    losses.files.clear();
    const ScanResult result = scan(request);
    for (std::string& name : names) name = folder.path(name);
    EXPECT_THAT(paths(result), ElementsAre(names));
    EXPECT_EQ(result.totals.folders, folders);
    EXPECT_EQ(result.totals.files, names.size() + 4);
    EXPECT_EQ(result.totals.hardLinks, 0u);
    EXPECT_THAT(losses.files, ElementsAre(Pair(folder.path("a/link"), Loss::Kind::unreadable),
                                          Pair(folder.path("a/missing"), Loss::Kind::vanished),
                                          Pair(folder.path("a/sub"), Loss::Kind::unreadable),
                                          Pair(folder.path("gone/7"), Loss::Kind::vanished)));
  };
  expectFound({"a/.3", "a/2", "a/sub/4"}, 0);
  request.folders = {folder.path()};
  expectFound({"a/.3", "a/1", "a/2", "a/sub/4", "a/sub/5"}, 3);
  request.skipsHidden = true;
  request.exclude = {"sub"};
  expectFound({"a/.3", "a/1", "a/2", "a/sub/4"}, 2);
  request.folders = {folder.path("a/sub")};
  expectFound({"a/.3", "a/2", "a/sub/4", "a/sub/5"}, 1);
  request.maxSize = 3;
  EXPECT_EQ(scan(request).totals.files, 4u) << "those that are lost";
}

TEST_F(ScanChoice, KeepsReferenceFoldersAsTheyAre) {
  writeAll({"archive/1", "archive/old/2", "archive/old/in/3", "new/4", "new/5"});
  folder.write("archive/alone1", "in the archive twice");
  folder.write("archive/alone2", "in the archive twice");
  fs::create_hard_link(folder.path("archive/1"), folder.path("Link"));
  const std::string archive = folder.path("archive");
  const struct {
    ScanRequest request;
    std::vector<std::string> references, others;
    std::uint64_t referenceFiles;
  } cases[] = {
      {{.folders = {folder.path("new")}, .references = {archive}},
       {"archive/1", "archive/old/2", "archive/old/in/3"},
       {"new/4", "new/5"},
       5},
      // A file of which any link is to stay is to stay.
      {{.folders = {folder.path()}, .references = {archive}},
       {"archive/1", "archive/old/2", "archive/old/in/3"},
       {"new/4", "new/5"},
       5},
      // A folder in a reference, and the other way round.
      {{.folders = {folder.path("archive/old"), folder.path("new")}, .references = {archive}},
       {"archive/1", "archive/old/2", "archive/old/in/3"},
       {"new/4", "new/5"},
       5},
      {{.folders = {folder.path("archive")}, .references = {folder.path("archive/old")}},
       {"archive/old/2", "archive/old/in/3"},
       {"archive/1"},
       2},
      {{.references = {folder.path("archive/old")},
        .files = {{folder.path("archive/old/in"), {"3"}}, {folder.path("new"), {"4"}}}},
       {"archive/old/2", "archive/old/in/3"},
       {"new/4"},
       2},
  };
  for (const auto& [request, references, others, referenceFiles] : cases) {
    fileSystem.readings.clear();
    const ScanResult result = scan(request);
    ASSERT_FALSE(result.groups.empty());
    const DuplicateGroup& group = result.groups.back();
    std::vector<std::string> kept, removable;
    const std::vector<std::string> names = result.pathsOf(group);
    for (std::uint32_t i = 0; i < group.count; ++i)
      (result.isReference(result.files[group.begin + i]) ? kept : removable)
          .push_back(names[i].substr(folder.path().size() + 1));
    EXPECT_EQ(kept, references);
    EXPECT_EQ(removable, others);
    EXPECT_EQ(result.totals.referenceFiles, referenceFiles);
    // One that has another name elsewhere frees nothing.
    EXPECT_EQ(group.wastedBytes, removable[0] == "archive/1" ? 0 : 4 * others.size());
    const bool isArchiveToStay = request.references[0] == archive;
    EXPECT_EQ(result.groups.size(), isArchiveToStay || request.folders.empty() ? 1u : 2u);
    EXPECT_EQ(result.totals.duplicateFiles, others.size() + result.groups.size() - 1);
    for (const FaultyFileSystem::Reading& reading : fileSystem.readings)
      EXPECT_FALSE(isArchiveToStay && reading.path.find("alone") != std::string::npos)
          << "nothing of it could go";
  }
  EXPECT_THAT(scan(ScanRequest{.references = {archive}}).groups, IsEmpty());
  EXPECT_THAT(
      scan(ScanRequest{.folders = {archive}, .references = {folder.path("gone")}}).lostFolders,
      ::testing::SizeIs(1));
}

TEST_F(ScanChoice, ReadsWhatIsMountedAtItsOwnDiskAndNoPseudoFileSystems) {
  using enum ScanMount::Kind;
  writeAll({"here/1", "local/2", "local/sub/3", "share/4", "kernel/5", "kernel/sub/6",
            "kernel/homes/.ada/7", "kernel/other/8", "kernel/masked", "quiet/9", "file"});
  const struct {
    const char* name;
    ScanMount::Kind kind;
    std::uint64_t device;
  } mounts[] = {{"local", local, 91},         {"share", network, 92},
                {"kernel", pseudo, 93},       {"kernel/homes/.ada", network, 94},
                {"kernel/other", pseudo, 95}, {"kernel/masked", local, 0},
                {"quiet", network, 96},       {"file", local, 0}};
  turns.mounted = {{"/", local}};
  for (const auto& [name, kind, device] : mounts) {
    turns.mounted.push_back({folder.path(name), kind});
    if (device == 0) continue;
    turns.mountedDisks[folder.path(name)];
    fileSystem.identities[folder.path(name)] = {device, 1};
  }
  fileSystem.identities[folder.path("local/sub")] = {91, 2};
  // While the tree is walked; in this one, files are of another device than their folders.
  fileSystem.beforeOpenFolder = [&](const std::string& path) {
    const auto mounted = turns.mountedDisks.find(path);
    if (mounted == turns.mountedDisks.end() || !FakeTurns::current() || control.filesToRead > 0)
      return;
    EXPECT_EQ(FakeTurns::current(), &mounted->second) << path << " was opened in another's turn";
  };
  const struct {
    ScanRequest request;
    std::vector<std::string> names;
    std::vector<std::string> networks;
  } cases[] = {
      {{.exclude = {"quiet"}},
       {"file", "here/1", "kernel/homes/.ada/7", "local/2", "local/sub/3", "share/4"},
       {"share", "kernel/homes/.ada"}},
      {{.exclude = {"homes"}, .skipsHidden = true},
       {"file", "here/1", "local/2", "local/sub/3", "quiet/9", "share/4"},
       {"share", "quiet"}},
      {{.staysOnFileSystem = true}, {"here/1"}, {}},
      {{.folders = {folder.path("kernel/sub"), folder.path("share"), folder.path("local")},
        .staysOnFileSystem = true},
       {"kernel/sub/6", "local/2", "local/sub/3", "share/4"},
       {"share"}},
      {{.folders = {folder.path("kernel")}},
       {"kernel/5", "kernel/homes/.ada/7", "kernel/masked", "kernel/sub/6"},
       {"kernel/homes/.ada"}},
  };
  for (const auto& [request, names, networks] : cases) {
    losses.networks.clear();
    control.filesToRead = 0;
    // One file makes no group.
    folder.write("here/more", names.size() == 1 ? "same" : "");
    ScanRequest whole = request;
    if (whole.folders.empty()) whole.folders = {folder.path()};
    const ScanResult result = scan(whole);
    std::vector<std::string> expected;
    for (const std::string& name : names) expected.push_back(folder.path(name));
    if (names.size() == 1) expected.push_back(folder.path("here/more"));
    EXPECT_THAT(paths(result), ElementsAre(expected));
    std::vector<std::string> said;
    for (const std::string& name : networks) said.push_back(folder.path(name));
    EXPECT_THAT(losses.folders, IsEmpty());
    EXPECT_THAT(losses.networks, ::testing::UnorderedElementsAreArray(said));
  }
}

// By the scan itself, where file systems are mounted on demand.
TEST_F(ScanChoice, KnowsWhatIsMountedOnlyMeanwhile) {
  using enum ScanMount::Kind;
  writeAll({"here/1", "home/2", "kernel/3"});
  turns.mounted = {{"/", local}};
  turns.mountedMeanwhile = {{folder.path("home"), network}, {folder.path("kernel"), pseudo}};
  fileSystem.identities = {{folder.path("home"), {92, 1}}, {folder.path("kernel"), {93, 1}}};
  EXPECT_THAT(paths(scan()),
              ElementsAre(ElementsAre(folder.path("here/1"), folder.path("home/2"))));
  EXPECT_THAT(losses.networks, ElementsAre(folder.path("home")));
}

}  // namespace
}  // namespace Orvane::Testing
