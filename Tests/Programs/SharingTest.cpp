// SPDX-License-Identifier: MIT
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <tuple>

#include <Removal/Sharing.h>
#include <Tests/Programs/RemovalFixture.h>
#include <Tests/Support/DiskImage.h>
#include <Tests/Support/MountNamespace.h>

namespace Orvane::Testing {
namespace {

using enum SharingStep::Outcome;
using ::testing::ElementsAre;
using Mode = Sharing::Mode;
using Outcomes = std::vector<SharingStep::Outcome>;
using Answer = FaultyFileSystem::ShareResult;

constexpr std::uint64_t part = 16 << 20;

// Before any test of this process: the catalogue goes on in the namespace in which it was first
// asked.
const std::string obstacleToMounts = Varnel::Tests::enterMountNamespace();

class SharedFiles : public RemovalFixture {
 protected:
  /// Makes every step, and returns what came of each.
  Outcomes shareAll(
      Mode mode = Mode::real, const std::function<void()>& didShare = [] {}) {
    Sharing sharing({fileSystem, Varnel::DiskAccessManager::shared()}, found, mode, shouldStop);
    while (sharing.next(didShare)) continue;
    sums = sharing.totals();
    Outcomes outcomes;
    for (const SharingStep& step : sharing.steps()) outcomes.push_back(step.outcome);
    return outcomes;
  }

  static Answer errorOf(std::errc error) { return std::make_error_code(error); }

  SharingTotals sums;
};

auto timesOf(const std::string& path) {
  struct stat facts {};
  EXPECT_EQ(::stat(path.c_str(), &facts), 0);
  return std::tuple(facts.st_mtim.tv_sec, facts.st_mtim.tv_nsec, facts.st_ctim.tv_sec,
                    facts.st_ctim.tv_nsec);
}

// What the file systems themselves do, in a mount of each.
TEST_F(SharedFiles, LieInOnePlace) {
  if (!obstacleToMounts.empty()) GTEST_SKIP() << obstacleToMounts;
  unsigned tried = 0;
  const auto images = Varnel::Tests::TemporaryFolder::inMemory();
  const std::string mounted = path("mounted");
  fs::create_directories(mounted);
  for (const auto& kind : {Varnel::Tests::DiskImage::xfs(), Varnel::Tests::DiskImage::btrfs()}) {
    const Varnel::Tests::DiskImage image(images.path() / kind.name, kind);
    if (image.name().empty() || !image.mount(mounted)) continue;
    SCOPED_TRACE(kind.name);
    ++tried;
    constexpr std::uint64_t size = part + 12'345;
    std::string content(size, 'x');
    for (std::size_t i = 0; i < size; i += 100) content[i] = static_cast<char>(i / 100);
    const std::vector<std::string> all = {"elsewhere", "mounted/a", "mounted/b", "mounted/c",
                                          "mounted/other"};
    for (const std::string& name : all) {
      write(name, content.substr(0, part));
      // The file system sets some space aside for what may follow.
      std::ofstream(path(name), std::ios::app) << content.substr(part);
    }
    Varnel::Tests::synchronise(mounted);
    found.groups.clear();
    report(all);
    found.groups[0].files[2].isReference = true;
    write("mounted/other", content.substr(1) + "y");
    const auto times = timesOf(path("mounted/c"));
    const auto timesOfReference = timesOf(path("mounted/b"));

    const Outcomes trial = {source, onOtherFileSystem, planned, planned, changed};
    EXPECT_EQ(shareAll(Mode::trial), trial);
    EXPECT_EQ(sums.freedBytes, 2 * size);
    const Outcomes real = {source, onOtherFileSystem, shared, shared, changed};
    EXPECT_EQ(shareAll(), real);
    EXPECT_EQ(sums.freedBytes, 2 * size);
    EXPECT_EQ(sums.notShared, 2u);
    EXPECT_EQ(timesOf(path("mounted/c")), times);
    EXPECT_EQ(timesOf(path("mounted/b")), timesOfReference);
    for (const std::string name : {"mounted/a", "mounted/b", "mounted/c"})
      EXPECT_TRUE(bytes(path(name)) == content) << name;
    const Outcomes again = {source, onOtherFileSystem, alreadyShared, alreadyShared, changed};
    EXPECT_EQ(shareAll(), again);
    EXPECT_EQ(sums.freedBytes, 0u);

    // One that changes without a trace is told by its content.
    fs::copy_file(path("mounted/other"), path("mounted/c"), fs::copy_options::overwrite_existing);
    report({"mounted/a", "mounted/c"});
    found.groups.erase(found.groups.begin());
    EXPECT_THAT(shareAll(), ElementsAre(source, different));
    EXPECT_TRUE(bytes(path("mounted/c")) == content.substr(1) + "y");
    write("mounted/c", content);
    Varnel::Tests::synchronise(mounted);
    found.groups.clear();
    report({"mounted/a", "mounted/c"});
    EXPECT_EQ(::mount(nullptr, mounted.c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0);
    EXPECT_THAT(shareAll(), ElementsAre(source, readOnly));
    EXPECT_EQ(::umount(mounted.c_str()), 0);
  }
  if (tried == 0) GTEST_SKIP() << "no mkfs.xfs, no mkfs.btrfs, or no loop devices";
}

TEST_F(SharedFiles, StayAsTheyAreWhenTheSystemRefuses) {
  const struct {
    Answer answer;
    SharingStep::Outcome outcome;
  } rows[] = {
      {std::optional<std::uint64_t>(), different},
      {std::optional<std::uint64_t>(0), failed},
      {errorOf(std::errc::cross_device_link), onOtherFileSystem},
      {errorOf(std::errc::operation_not_supported), unsupported},
      {errorOf(std::errc::inappropriate_io_control_operation), unsupported},
      {errorOf(std::errc::read_only_file_system), readOnly},
      {errorOf(std::errc::operation_not_permitted), notPermitted},
      {errorOf(std::errc::permission_denied), notPermitted},
      {errorOf(std::errc::text_file_busy), failed},
  };
  for (const char* name : {"a", "b"}) write(name, "same");
  report({"a", "b"});
  for (const auto& row : rows) {
    fileSystem.share = [&](auto&&...) { return row.answer; };
    EXPECT_THAT(shareAll(), ElementsAre(source, row.outcome));
    EXPECT_EQ(sums.notShared, 1u);
    EXPECT_EQ(sums.isSupported, row.outcome != unsupported);
  }
  fileSystem.share = {};
  EXPECT_THAT(shareAll(), ElementsAre(source, unsupported)) << "in memory";

  fileSystem.share = [&](auto&&...) -> Answer {
    write("b", "more");
    return std::optional<std::uint64_t>();
  };
  EXPECT_THAT(shareAll(), ElementsAre(source, changed));
  fileSystem.openFaults[path("a")] = std::errc::permission_denied;
  EXPECT_THAT(shareAll(), ElementsAre(unreadable, changed));
  fileSystem.openFaults.clear();
  fs::remove(path("a"));
  fs::create_symlink("b", path("a"));
  EXPECT_THAT(shareAll(), ElementsAre(changed, changed));
}

TEST_F(SharedFiles, AreDoneInPartsAndStopBetween) {
  constexpr std::uint64_t size = 2 * part + 1;
  for (const char* name : {"a", "b"}) fs::resize_file(write(name, ""), size);
  report({"a", "b"});
  std::vector<std::pair<std::uint64_t, std::uint64_t>> parts;
  fileSystem.share = [&](auto&, auto&, std::uint64_t offset, std::uint64_t length) {
    parts.emplace_back(offset, length);
    return Answer(std::optional(offset == 0 ? length / 2 : length));
  };
  EXPECT_THAT(shareAll(), ElementsAre(source, shared));
  EXPECT_THAT(parts, ElementsAre(std::pair(0u, part), std::pair(part / 2, part),
                                 std::pair(part / 2 * 3, part / 2 + 1)));
  parts.clear();
  EXPECT_THAT(shareAll(Mode::trial), ElementsAre(source, planned));
  EXPECT_THAT(parts, ElementsAre(std::pair(0u, 0u)));
  EXPECT_THAT(shareAll(Mode::real, [&] { shouldStop = true; }), ElementsAre(source, stopped));
  EXPECT_EQ(sums.notShared, 1u);
}

TEST_F(SharedFiles, FreeWhatTheyHeldAlone) {
  constexpr std::uint64_t size = 4096;
  const struct {
    SharedExtents before, after;
    SharingStep::Outcome outcome;
    std::uint64_t freedBytes;
  } rows[] = {
      {{}, {.bytes = size, .place = 1}, shared, size},
      {{.bytes = size / 4}, {.bytes = size, .place = 1}, shared, size / 4 * 3},
      {{.bytes = size, .place = 2}, {.bytes = size, .place = 1}, shared, 0},
      {{.bytes = size, .place = 1}, {}, alreadyShared, 0},
      {{.inlineBytes = size}, {}, withoutExtents, 0},
      {{}, {.inlineBytes = size}, withoutExtents, 0},
  };
  for (const char* name : {"a", "b"}) write(name, std::string(size, 'x'));
  report({"a", "b"});
  for (const auto& row : rows) {
    fileSystem.shared = {{path("a"), {.bytes = size, .place = 1}}, {path("b"), row.before}};
    fileSystem.share = [&](auto&, auto& file, auto, std::uint64_t length) {
      fileSystem.shared[file] = row.after;
      return Answer(std::optional(length));
    };
    EXPECT_THAT(shareAll(), ElementsAre(source, row.outcome));
    EXPECT_EQ(sums.freedBytes, row.freedBytes);
    EXPECT_EQ(sums.notShared, 0u);
  }
}

}  // namespace
}  // namespace Orvane::Testing
