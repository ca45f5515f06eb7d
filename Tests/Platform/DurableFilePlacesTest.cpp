// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sqlite3.h>
#include <sys/stat.h>

#include <csignal>
#include <fstream>

#include <Tests/Platform/DurableNotes.h>
#include <Tests/Support/TemporaryFolder.h>

// Where a durable file may lie, and what it does on disks that are full or cannot be written. Each
// test runs as this user and, where that is root, as an ordinary one too.
namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;
using namespace Platform;

// All that can be told of a folder's entries: their kind, mode, owner, and what they hold.
std::string portrait(const fs::path& folder) {
  std::map<std::string, std::string> entries;
  for (const auto& entry : fs::recursive_directory_iterator(folder)) {
    struct stat facts {};
    ::lstat(entry.path().c_str(), &facts);
    std::string& text = entries[entry.path()];
    text = std::to_string(facts.st_mode) + " " + std::to_string(facts.st_uid) + " ";
    if (entry.is_symlink()) text += fs::read_symlink(entry.path());
    if (entry.is_regular_file() && !entry.is_symlink()) {
      std::ifstream file(entry.path(), std::ios::binary);
      text.append(std::istreambuf_iterator<char>(file), {});
    }
  }
  return testing::PrintToString(entries);
}

mode_t modeOf(const fs::path& path) {
  struct stat facts {};
  return ::lstat(path.c_str(), &facts) == 0 ? facts.st_mode & 07777 : 0;
}

constexpr Journal journals[] = {Journal::rollback, Journal::writeAhead};

// Takes all the room that is left, as far as pieces of this size fill it.
void fill(const fs::path& file, std::size_t piece) {
  std::ofstream stream(file, std::ios::binary | std::ios::app);
  while (stream << std::string(piece, 'x') << std::flush) continue;
}

class DurableFilePlacesTest : public testing::Test {
 protected:
  void beginFor(uid_t user) {
    fs::remove_all(home_);
    fs::create_directories(home_);
    give(home_, user);
    fs::permissions(folder_.path(), fs::perms::all);
  }

  // On a disk in memory, where the machine grants one.
  void onSmallDisk(const std::function<void()>& act) {
    beginFor(::geteuid());
    inChild(::geteuid(), act, home_);
  }

  TemporaryFolder folder_;
  const fs::path home_ = folder_.path() / "home";
  const fs::path path_ = home_ / "state" / "notes.sqlite";
};

TEST_F(DurableFilePlacesTest, WhatIsNotTheUsersOwnIsRefusedAndNeverChanged) {
  struct Case {
    const char* what;
    std::function<void(uid_t)> prepare;
    std::string expected = "refused";
    bool needsRoot = false;
  };
  const fs::path other = home_ / "other";
  const auto file = [](const fs::path& path, uid_t user) {
    std::ofstream(path) << "letter";
    give(path, user);
  };
  const auto link = [](const fs::path& to, const fs::path& at, uid_t user) {
    fs::create_symlink(to, at);
    give(at, user);
  };
  const auto database = [&](const char* sql) {
    return [&, sql](uid_t user) {
      auto made = SQLiteDatabase::open(path_, SQLiteDatabase::Access::readWrite);
      EXPECT_FALSE(made->execute(sql));
      give(path_, user);
    };
  };
  std::vector<Case> cases{
      {"a link to a file",
       [&](uid_t user) {
         file(other, user);
         link(other, path_, user);
       }},
      {"a link to nothing", [&](uid_t user) { link(other, path_, user); }},
      {"a folder",
       [&](uid_t user) {
         fs::create_directory(path_);
         give(path_, user);
       }},
      {"a pipe",
       [&](uid_t user) {
         ::mkfifo(path_.c_str(), 0644);
         give(path_, user);
       }},
      {"another's file", [&](uid_t) { file(path_, 1234); }, "refused", true},
      {"another's folder", [&](uid_t) { give(path_.parent_path(), 1234); }, "refused", true},
      {"another's journal", [&](uid_t) { file(path_.string() + "-wal", 1234); }, "refused", true},
      {"another application's file",
       database("PRAGMA application_id = 7; CREATE TABLE note(key TEXT)")},
      {"nobody's file", database("CREATE TABLE note(key TEXT)")},
      {"a newer file",
       database("PRAGMA application_id = 0x4E4F5445; PRAGMA user_version = 2000;"
                "CREATE TABLE note(key TEXT)"),
       "newer"},
      {"an older file",
       database("PRAGMA application_id = 0x4E4F5445; PRAGMA user_version = 1;"
                "CREATE TABLE note(key TEXT)"),
       "older"}};
  for (const char* journal : {"-journal", "-wal", "-shm"})
    cases.push_back({journal, [&, journal](uid_t user) {
                       file(other, user);
                       link(other, path_.string() + journal, user);
                     }});
  for (const uid_t user : users()) {
    for (const Case& one : cases) {
      if (one.needsRoot && ::geteuid() != 0) continue;
      SCOPED_TRACE(one.what);
      beginFor(user);
      fs::create_directory(path_.parent_path());
      give(path_.parent_path(), user);
      one.prepare(user);
      const std::string before = portrait(home_);
      inChild(user, [&] {
        Notebook book(path_, notes(Journal::writeAhead));
        for (int time = 0; time < 3; ++time) {
          EXPECT_EQ(book.add("a"), one.expected);
          EXPECT_EQ(book.keys(), one.expected);
        }
        EXPECT_EQ(book.log.lines.size(), 1u) << testing::PrintToString(book.log.lines);
      });
      const fs::path lock = path_.string() + ".opening";
      if (fs::exists(lock)) fs::remove(lock);
      EXPECT_EQ(portrait(home_), before);
    }
  }
}

TEST_F(DurableFilePlacesTest, OnlyTheUserCanReadWhateverTheMaskAndLinksAre) {
  for (const uid_t user : users()) {
    for (const mode_t mask : {0000u, 0022u, 0077u, 0777u}) {
      for (const bool isOld : {false, true}) {
        SCOPED_TRACE(mask);
        beginFor(user);
        inChild(user, [&] {
          // A home that is reached by a link is legitimate.
          fs::create_directory(home_ / "disk");
          fs::create_directory_symlink(home_ / "disk", home_ / "state");
          const fs::path path = home_ / "state" / "a" / "b" / "notes.sqlite";
          if (isOld) {
            fs::create_directories(path.parent_path());
            Notebook(path, notes(Journal::writeAhead)).add("a");
            for (const char* suffix : {"", "-wal", "-shm"})
              fs::permissions(path.string() + suffix, fs::perms(0666));
          }
          ::umask(mask);
          Notebook book(path, notes(Journal::writeAhead));
          EXPECT_EQ(book.add("a"), "kept");
          for (const char* suffix : {"", "-wal", "-shm", ".opening"})
            EXPECT_EQ(modeOf(path.string() + suffix), 0600u) << suffix;
          for (const char* made : {"disk/a", "disk/a/b"})
            EXPECT_TRUE(isOld || modeOf(home_ / made) == 0700u);
        });
      }
    }
  }
}

TEST_F(DurableFilePlacesTest, ALockEndsWithItsOwnerThoughAForkedChildLives) {
  const auto files = POSIX::makePrivateFiles();
  auto lock = files->tryLock(path_).value();
  ASSERT_TRUE(lock);
  EXPECT_FALSE(files->tryLock(path_).value());
  const pid_t child = ::fork();
  if (child == 0) ::_exit(::pause());
  lock.reset();
  EXPECT_TRUE(files->tryLock(path_).value());
  ::kill(child, SIGKILL);
  ::waitpid(child, nullptr, 0);
}

TEST_F(DurableFilePlacesTest, AFullDiskRefusesAndLaterTakes) {
  for (const Journal journal : journals) {
    for (const bool isNew : {true, false}) {
      SCOPED_TRACE(isNew);
      onSmallDisk([&] {
        Notebook book(path_, notes(journal));
        EXPECT_TRUE(isNew || book.add("a") == "kept");
        const fs::path ballast = home_ / "ballast";
        for (const std::size_t piece : {65536u, 1u}) fill(ballast, piece);
        std::string answer = "kept";
        for (int number = 0; number < 2000 && answer == "kept"; ++number)
          answer = book.add("full" + std::to_string(number) + std::string(500, '.'));
        EXPECT_EQ(answer, "full");
        EXPECT_EQ(book.change(std::string(5000, 'y')), "full");
        fs::remove(ballast);
        EXPECT_EQ(book.add("b"), "kept");
        EXPECT_EQ(Notebook(path_, notes(journal)).keys(), book.keys());
        EXPECT_EQ(book.file.damageCount(), 0);
      });
    }
  }
}

TEST_F(DurableFilePlacesTest, RowsForWhichThereIsNoRoomYetAreNotForgotten) {
  for (const Journal journal : journals) {
    onSmallDisk([&] {
      std::string all;
      {
        Notebook book(path_, notes(journal));
        EXPECT_FALSE(book.file.change([](SQLiteDatabase& database) {
          Failure error;
          for (char key = 'a'; key < 'q' && !error; ++key)
            error = Notebook::insert(database, std::string(5000, key));
          return error;
        }));
        all = book.keys();
      }
      const fs::path pending = path_.string() + ".salvage";
      fs::rename(path_, pending);
      for (const char* suffix : {"-wal", "-shm", "-journal"})
        if (fs::exists(path_.string() + suffix))
          fs::rename(path_.string() + suffix, pending.string() + suffix);
      const fs::path ballast = home_ / "ballast";
      fill(ballast, 1 << 12);
      fs::resize_file(ballast, fs::file_size(ballast) - (80 << 10));
      for (int time = 0; time < 2; ++time)
        EXPECT_EQ(Notebook(path_, notes(journal)).keys(), "full");
      // The new file may be damaged before it is used.
      std::ofstream(path_) << std::string(5000, 'x');
      EXPECT_EQ(Notebook(path_, notes(journal)).keys(), "full");
      fs::remove(ballast);
      Notebook book(path_, notes(journal));
      EXPECT_TRUE(book.keys() == all) << book.keys().substr(0, 100);
      EXPECT_FALSE(fs::exists(pending));
    });
  }
}

TEST_F(DurableFilePlacesTest, WhatCanOnlyBeReadIsRead) {
  for (const Journal journal : journals) {
    for (const bool hasJournals : {true, false}) {
      for (const bool isMount : {true, false}) {
        for (const uid_t user : users()) {
          // Root may write into a folder whatever its mode is.
          if (!isMount && user == 0) continue;
          if (isMount && user != ::geteuid()) continue;
          SCOPED_TRACE(testing::Message() << hasJournals << isMount << user);
          beginFor(user);
          inChild(user, [&] {
            Notebook(path_, notes(journal)).add("a");
            const fs::path folder = path_.parent_path();
            if (!hasJournals) {
              auto database = SQLiteDatabase::open(path_, SQLiteDatabase::Access::readWrite);
              EXPECT_FALSE(database->execute("PRAGMA wal_checkpoint(TRUNCATE)"));
              for (const char* suffix : {"-wal", "-shm", "-journal", ".opening"})
                fs::remove(path_.string() + suffix);
            }
            if (isMount) {
              if (!enterMountNamespace().empty()) return;
              ASSERT_EQ(::mount(folder.c_str(), folder.c_str(), nullptr, MS_BIND, nullptr), 0);
              ASSERT_EQ(::mount(nullptr, folder.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY,
                                nullptr),
                        0);
            } else {
              fs::permissions(folder, fs::perms(0500));
            }
            Notebook book(path_, notes(journal));
            EXPECT_EQ(book.keys(), "a");
            if (isMount || !hasJournals) {
              EXPECT_EQ(book.add("b"), "read-only");
              EXPECT_EQ(book.change("b"), "read-only");
              EXPECT_EQ(book.keys(), "a");
            }
            EXPECT_EQ(Notebook(folder / "new.sqlite", notes(journal)).add("a"), "read-only");
            if (!isMount) fs::permissions(folder, fs::perms(0700));
          });
        }
      }
    }
  }
}

TEST_F(DurableFilePlacesTest, WithoutSharedMemoryThePlainJournalIsUsed) {
  beginFor(::geteuid());
  inChild(::geteuid(), [&] {
    ::sqlite3_vfs_register(::sqlite3_vfs_find("unix-dotfile"), 1);
    Notebook book(path_, notes(Journal::writeAhead));
    EXPECT_EQ(book.add("a"), "kept");
    EXPECT_EQ(book.change("b"), "kept");
    EXPECT_EQ(book.keys(), "ab");
    EXPECT_FALSE(fs::exists(path_.string() + "-wal"));
  });
}

}  // namespace
}  // namespace Varnel::Tests
