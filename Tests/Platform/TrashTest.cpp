// SPDX-License-Identifier: MIT
#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <set>

#include <Tests/Platform/TrashFixture.h>
#include <Tests/Support/AsUser.h>
#include <Tests/Support/ChildProcess.h>

namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

class TrashTest : public TrashFixture {};

// Names that are no text, are as long as can be, or look like something else.
std::vector<std::string> oddNames() {
  std::vector<std::string> names{" a", "a b", "-x",      "%41", "a\nPath=b",  "\xFF\xFE",
                                 "ü",  "a\\", ".hidden", "#;[", "a.trashinfo"};
  names.push_back(std::string(255, 'x'));
  names.push_back(std::string(254, 'x') + 'y');
  names.push_back(std::string(255, '\x80'));
  std::string wide = "x";
  while (wide.size() < 255) wide += "ü";
  names.push_back(wide);
  return names;
}

TEST_F(TrashTest, KeepsEveryNameThereIs) {
  std::vector<TrashedFile> gone;
  for (const std::string& name : oddNames()) {
    const fs::path path = home.write(fs::path("files") / name, name);
    const auto moved = move(path);
    ASSERT_TRUE(moved) << name << moved.error().code;
    EXPECT_EQ(bytes(*moved), name);
    gone.push_back(*moved);
  }
  EXPECT_THAT(contents(), testing::UnorderedElementsAreArray(gone));
  for (const TrashedFile& each : gone) {
    EXPECT_FALSE(trash->restore(each, Folders::leave)) << each.path;
    EXPECT_EQ(bytes(fs::path(each.path)), fs::path(each.path).filename());
  }
  EXPECT_TRUE(fs::is_empty(folder + "/info"));
  EXPECT_TRUE(fs::is_empty(folder + "/files"));
  const TrashedFile last = *move(file);
  fs::rename(folder, home.path() / "elsewhere");
  EXPECT_EQ(trash->restore(last, Folders::leave)->reason, Reason::emptied);
  // Through a link it may lie on a disk that is not there now.
  TrashedFile linked = last;
  linked.folder = home.path() / "data" / "other";
  EXPECT_EQ(trash->restore(linked, Folders::leave)->reason, Reason::noTrash);
}

TEST_F(TrashTest, TellsWhereAndWhenInTheFormOfTheDesktop) {
  clock.set(std::chrono::sys_days(std::chrono::year(2026) / 2 / 28) + 23h + 5min);
  zones.local = "Far/East";
  zones.changes[zones.local] = {{Platform::Date(), {9h}}};
  const auto moved = move(home.write("files/%ü b", ""));
  EXPECT_EQ(info(*moved), "[Trash Info]\nPath=" + home.path().string() +
                              "/files/%25%C3%BC%20b\nDeletionDate=2026-03-01T08:05:00\n");
  for (const char* part : {"", "/files", "/info"})
    EXPECT_EQ(fs::status(folder + part).permissions(), fs::perms::owner_all) << part;

  // What others have written, or forged.
  const std::pair<std::string, bool> rows[] = {
      {"[Trash Info]\r\nPath=/b\n", false},
      {"Path=" + file.string() + "\n", false},
      {"", false},
      {std::string(100'000, '\n'), false},
      {"[Trash Info]\nDeletionDate=\nPath=" + file.string(), true},
  };
  const TrashedFile mine = *move(file);
  for (const auto& [text, isOurs] : rows) {
    home.write("data/Trash/info/a.trashinfo", text);
    const auto error = trash->restore(mine, Folders::leave);
    EXPECT_EQ(!error, isOurs) << text.substr(0, 60);
  }
  for (const char* name : {"../files/b", "", ".."}) {
    TrashedFile forged = mine;
    forged.name = name;
    EXPECT_EQ(trash->restore(forged, Folders::leave)->code, std::errc::invalid_argument);
  }
}

TEST_F(TrashTest, FollowsNoLinkAndTakesNoFolder) {
  fs::create_directory_symlink(home.path() / "files", home.path() / "link");
  fs::create_symlink(file, home.path() / "files" / "b");
  const auto state = *trash->state(file);
  for (const char* path : {"link/a", "files/b", "files", "files/../files/a", "files/a/b"}) {
    EXPECT_FALSE(trash->state(home.path() / path)) << path;
    EXPECT_FALSE(trash->move(home.path() / path, state, always)) << path;
  }
  // What lies in the trash already is not moved again: its first place would be forgotten.
  const TrashedFile moved = *move(home.path() / "files" / "." / "a");
  EXPECT_EQ(moved.path, file);
  EXPECT_EQ(move(folder + "/files/a").error().reason, Reason::noTrash);

  fs::rename(home.path() / "files", home.path() / "real");
  fs::create_directory_symlink(home.path() / "real", home.path() / "files");
  EXPECT_EQ(trash->restore(moved, Folders::recreate)->reason, Reason::folderMissing);
  EXPECT_FALSE(fs::exists(home.path() / "real" / "a"));
}

TEST_F(TrashTest, GivesSeveralProcessesADifferentNameEach) {
  constexpr int processes = 4, each = 20;
  for (int i = 0; i < processes * each; ++i)
    home.write("files/" + std::to_string(i) + "/same", std::to_string(i));
  std::vector<pid_t> children;
  for (int process = 0; process < processes; ++process) {
    children.push_back(::fork());
    if (children.back() != 0) continue;
    for (int i = process * each; i < (process + 1) * each; ++i)
      if (!move(home.path() / "files" / std::to_string(i) / "same")) ::_exit(1);
    ::_exit(0);
  }
  for (const pid_t child : children) {
    int status = -1;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
  }
  std::set<std::string> found;
  for (const TrashedFile& moved : contents())
    if (fs::path(moved.path).parent_path().filename() == bytes(moved)) found.insert(bytes(moved));
  EXPECT_EQ(found.size(), std::size_t{processes * each});
}

// The trash of another volume: who may have made it, and what is refused before anything is done.
TEST_F(TrashTest, UsesTheTrashOfTheFilesOwnVolume) {
  const TemporaryFolder place;
  const fs::path disk = place.path();
  const std::string shared = disk / ".Trash";
  const auto makeShared = [&](mode_t mode) {
    fs::create_directory(shared);
    EXPECT_EQ(::chmod(shared.c_str(), mode), 0);
  };
  for (const uid_t user : users()) {
    const std::string number = std::to_string(user);
    const std::string own = disk / (".Trash-" + number);
    const struct {
      const char* what;
      std::function<void()> arrange;
      std::string expected;
      Reason reason = Reason::noTrash;
    } rows[] = {
        {"none yet", [] {}, own},
        {"everybody's", [&] { makeShared(01777); }, shared + "/" + number},
        {"not sticky", [&] { makeShared(0777); }, own},
        {"a link", [&] { fs::create_directory_symlink(disk / "elsewhere", shared); }, own},
        {"own one a link", [&] { fs::create_directory_symlink(disk / "elsewhere", own); }, ""},
        {"own one a file", [&] { std::ofstream(own) << ""; }, ""},
        {"full",
         [&] {
           std::ofstream big(disk / "big");
           while (big << std::string(4096, 'x') << std::flush) {
           }
         },
         "", Reason::failed},
        {"read-only",
         [&] {
           if (user == 0)
             ::mount("", disk.c_str(), "", MS_REMOUNT | MS_RDONLY, "");
           else
             fs::permissions(disk, fs::perms::owner_read | fs::perms::owner_exec);
         },
         ""},
    };
    for (const auto& row : rows) {
      fs::permissions(disk, fs::perms::all);
      const bool isDone = inChild(
          user,
          [&] {
            fs::create_directories(disk / "sub");
            EXPECT_EQ(::chmod((disk / "sub").c_str(), 0777), 0);
            fs::create_directory(disk / "elsewhere");
            const fs::path path = disk / "sub" / "ü";
            std::ofstream(path) << "bytes";
            row.arrange();
            const auto moved = move(path);
            if (row.expected.empty()) {
              ASSERT_FALSE(moved) << row.what;
              EXPECT_EQ(moved.error().reason, row.reason) << row.what << moved.error().code;
              EXPECT_EQ(bytes(path), "bytes");
              EXPECT_TRUE(fs::is_empty(disk / "elsewhere")) << row.what;
              return;
            }
            ASSERT_TRUE(moved) << row.what << moved.error().code;
            EXPECT_EQ(moved->folder, row.expected) << row.what;
            EXPECT_THAT(info(*moved), testing::HasSubstr("\nPath=sub/%C3%BC\n"));
            EXPECT_EQ(trash->contents(moved->folder)->at(0), *moved);
            EXPECT_FALSE(trash->restore(*moved, Folders::leave)) << row.what;
            EXPECT_EQ(bytes(path), "bytes");
          },
          disk);
      if (!isDone) GTEST_SKIP() << "no mounts of its own";
    }
  }
}

// A folder that is mounted a second time lies on the same disk, and yet no step leads across.
TEST_F(TrashTest, KnowsOneDiskInTwoMounts) {
  const fs::path second = home.path() / "second";
  fs::create_directory(second);
  const bool isDone = inChild(::geteuid(), [&] {
    if (!enterMountNamespace().empty() ||
        ::mount((home.path() / "files").c_str(), second.c_str(), "", MS_BIND, "") != 0)
      ::_exit(77);
    const auto moved = move(second / "a");
    ASSERT_TRUE(moved) << moved.error().code;
    EXPECT_EQ(moved->folder, second / (".Trash-" + std::to_string(::geteuid())));
    EXPECT_FALSE(trash->restore(*moved, Folders::leave));

    // What is gone is gone only where its disk is there.
    ASSERT_TRUE(move(second / "a"));
    fs::remove_all(moved->folder);
    EXPECT_EQ(trash->restore(*moved, Folders::leave)->reason, Reason::emptied);
    EXPECT_EQ(::umount2(second.c_str(), MNT_DETACH), 0);
    EXPECT_EQ(trash->restore(*moved, Folders::leave)->reason, Reason::noTrash);
  });
  if (!isDone) GTEST_SKIP() << "no mounts of its own";
}

// As the desktop's program prints a path; it restores nothing whose path it does not print plainly.
std::string printed(const std::string& path) {
  std::string text;
  for (const char c : path)
    text += c >= ' ' && c <= '~' && c != '\\'
                ? std::string(1, c)
                : fmt::format("\\x{:02x}", static_cast<unsigned char>(c));
  return text;
}

TEST_F(TrashTest, IsUnderstoodByTheDesktop) {
  const std::string desktop = "dbus-run-session -- gio trash ";
  if (outputOf(desktop + "--list 2>&1 && echo works").find("works") == std::string::npos)
    GTEST_SKIP() << "gio, or the desktop's service for the trash, is not installed";
  std::vector<fs::path> plain;
  for (const std::string& name : oddNames()) {
    const fs::path path = home.write(fs::path("files") / name, name);
    ASSERT_TRUE(move(path)) << name;
    if (printed(path) == path) plain.push_back(path);
  }
  const std::string list = outputOf(desktop + "--list 2>/dev/null");
  std::string addresses;
  for (const TrashedFile& each : contents()) {
    const std::size_t end = list.find("\t" + printed(each.path) + "\n");
    ASSERT_NE(end, list.npos) << each.path << " in " << list;
    const std::size_t begin = list.rfind('\n', end) + 1;
    if (printed(each.path) == each.path) addresses += " '" + list.substr(begin, end - begin) + "'";
  }
  outputOf(desktop + "--restore" + addresses + " 2>/dev/null");
  for (const fs::path& path : plain) EXPECT_EQ(bytes(path), path.filename());
  EXPECT_GE(plain.size(), 8u);
  EXPECT_EQ(contents().size(), oddNames().size() - plain.size());
}

}  // namespace
}  // namespace Varnel::Tests
