// SPDX-License-Identifier: MIT
#include <signal.h>

#include <fstream>

#include <Tests/Platform/DurableNotes.h>
#include <Tests/Support/OtherProcess.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;
using namespace Platform;
using Looking = DurableFile::Looking;

void overwrite(const fs::path& path, std::streamoff at, const std::string& bytes) {
  std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
  file.seekp(at);
  file << bytes;
}

class DurableFileTest : public testing::TestWithParam<Journal> {
 protected:
  static bool hasLog() { return GetParam() == Journal::writeAhead; }
  fs::path beside(const char* suffix) const { return path_.string() + suffix; }
  std::unique_ptr<Notebook> open() const {
    return std::make_unique<Notebook>(path_, notes(GetParam()));
  }

  // Moves all of the log into the file, which then stands alone.
  void emptyLog() const {
    auto database = SQLiteDatabase::open(path_, SQLiteDatabase::Access::readWrite);
    EXPECT_FALSE(database->execute("PRAGMA wal_checkpoint(TRUNCATE)"));
  }

  TemporaryFolder folder_ = TemporaryFolder::inMemory();
  const fs::path path_ = folder_.path() / "state" / "notes.sqlite";
};

INSTANTIATE_TEST_SUITE_P(, DurableFileTest, testing::Values(Journal::rollback, Journal::writeAhead),
                         [](const auto& one) {
                           return one.param == Journal::rollback ? "Rollback" : "WriteAhead";
                         });

TEST_P(DurableFileTest, KeepsWhatIsTakenAwayUnderIt) {
  struct Case {
    const char* what;
    std::function<void()> act;
    bool isCounted = true;
    bool isSaid = true;
    std::string left = "abcd";
  };
  const fs::path backup = folder_.path() / "backup";
  const fs::path moved = folder_.path() / "moved";
  const auto remove = [&](auto... suffixes) { (fs::remove(beside(suffixes)), ...); };
  const std::vector<Case> cases{
      {"the file removed", [&] { remove(""); }},
      {"all files removed", [&] { remove("", "-wal", "-shm", "-journal"); }},
      {"the folder removed", [&] { fs::remove_all(path_.parent_path()); }},
      {"the folder renamed", [&] { fs::rename(path_.parent_path(), moved); }},
      {"the file renamed", [&] { fs::rename(path_, beside(".away")); }},
      {"the file replaced", [&] { fs::rename(backup, path_); }, false, true, "abcdz"},
      {"the file emptied", [&] { fs::resize_file(path_, 0); }, true, true,
       hasLog() ? "abcd" : "bcd"},
      {"the journal removed", [&] { remove("-wal"); }, hasLog(), hasLog()},
      {"the journal renamed",
       [&] {
         if (hasLog()) fs::rename(beside("-wal"), beside(".away"));
       },
       hasLog(), hasLog()},
      {"the journals removed", [&] { remove("-wal", "-shm", "-journal"); }, hasLog(), hasLog()},
      {"the journal replaced",
       [&] {
         std::ofstream(beside("-new"));
         fs::rename(beside("-new"), beside("-wal"));
       },
       hasLog(), hasLog()},
  };
  for (const Case& one : cases) {
    // By a statement, by a transaction, between a commit and its answer, and after an answer that
    // was given without a look.
    for (const int when : {1, 2, 3, 4}) {
      SCOPED_TRACE(std::string(one.what) + ", found by way " + std::to_string(when));
      fs::remove_all(path_.parent_path());
      fs::remove_all(moved);
      EXPECT_EQ(Notebook(backup, notes(Journal::rollback)).add("z"), "kept");
      auto book = open();
      EXPECT_EQ(book->add("a"), "kept");
      bool isDone = false;
      const auto actOnce = [&] {
        if (!std::exchange(isDone, true)) one.act();
      };
      if (when < 3) actOnce();
      const auto looking = when == 4 ? Looking::eachMillisecond : Looking::eachTime;
      EXPECT_EQ(when == 2 ? book->change("b") : book->add("b", actOnce, looking), "kept");
      EXPECT_EQ(book->add("c"), "kept");
      EXPECT_EQ(open()->add("d"), "kept");
      // Without a log, what a file held is gone with it; nothing accepted since is.
      EXPECT_EQ(open()->keys(), one.left);
      EXPECT_EQ(book->file.damageCount(), one.isCounted ? 1 : 0);
      EXPECT_EQ(book->log.lines.size(), one.isSaid ? 1u : 0u);
    }
  }
}

TEST_P(DurableFileTest, WhatOneConnectionHasTakenOverAnotherDoesNotBringBack) {
  const fs::path moved = folder_.path() / "moved";
  const std::vector<std::function<void()>> ways{
      [&] { fs::rename(path_.parent_path(), moved); },
      [&] { fs::remove(path_); },
      [&] { fs::remove(beside("-wal")); },
  };
  for (std::size_t way = 0; way < ways.size(); ++way) {
    SCOPED_TRACE(way);
    fs::remove_all(path_.parent_path());
    fs::remove_all(moved);
    auto one = open();
    auto other = open();
    EXPECT_EQ(one->add("a"), "kept");
    EXPECT_EQ(other->add("b"), "kept");
    // The other's statement is run into the old file, and once more into the new one.
    std::vector<std::string> keys{"c", "d"};
    EXPECT_FALSE(other->file.changeByOneStatement([&](SQLiteDatabase& database) {
      if (keys.size() == 2) {
        ways[way]();
        EXPECT_EQ(one->keys(), "ab");
        EXPECT_EQ(one->clear(), "kept");
      }
      auto error = Notebook::insert(database, keys.front());
      keys.erase(keys.begin());
      return error;
    }));
    // Without a log nothing can be written into the old file, and nothing is lost with a journal.
    EXPECT_EQ(other->keys(), hasLog() ? "cd" : way == 2 ? "c" : "d");
    EXPECT_EQ(open()->keys(), one->keys());
    EXPECT_LE(one->file.damageCount(), 1);
  }
}

TEST_P(DurableFileTest, AChangeThatFailsIsNotFoundLater) {
  const auto own = POSIX::makePrivateFiles();
  Platform::Testing::FaultyPrivateFiles files(*own);
  Notebook book(path_, notes(GetParam()), Migrating::allowed, &files);
  ASSERT_EQ(book.add("a"), "kept");
  const auto lose = [&] {
    fs::rename(path_, beside(".away"));
    files.faults->plan(Platform::Testing::Fault::absent, files.faults->calls() + 1);
  };
  EXPECT_EQ(book.change("lost", lose), "busy");
  files.faults->mend();
  EXPECT_EQ(book.keys(), "a");
  EXPECT_THROW(static_cast<void>(book.change("thrown", [] { throw std::bad_alloc(); })),
               std::bad_alloc);
  EXPECT_EQ(open()->change("b"), "kept");
  EXPECT_EQ(book.keys(), "ab");
}

TEST_P(DurableFileTest, WhatCannotBePutAwayIsNotTakenOverAgain) {
  EXPECT_EQ(open()->add("a"), "kept");
  emptyLog();
  fs::create_directory(beside(".damaged"));
  fs::rename(path_, beside(".salvage"));
  EXPECT_EQ(open()->add("b"), "kept");
  EXPECT_EQ(open()->keys(), "ab");
  EXPECT_EQ(open()->clear(), "kept");
  EXPECT_EQ(open()->keys(), "");
  EXPECT_EQ(open()->file.damageCount(), 1);
  EXPECT_FALSE(fs::exists(beside(".salvage")));
}

TEST_P(DurableFileTest, SetsADamagedFileAsideAndSavesItsRows) {
  struct Case {
    const char* what;
    std::function<void()> act;
    bool isSalvaged;
  };
  constexpr int rows = 2000;
  const auto execute = [&](const char* sql) {
    auto database = SQLiteDatabase::open(path_, SQLiteDatabase::Access::readWrite);
    EXPECT_FALSE(database->execute(std::string("PRAGMA writable_schema = ON;") + sql));
  };
  const std::vector<Case> cases{
      {"no database", [&] { std::ofstream(path_) << std::string(20000, 'x'); }, false},
      {"a damaged header", [&] { overwrite(path_, 0, std::string(100, '\0')); }, false},
      {"damaged pages", [&] { overwrite(path_, 6 * 4096, std::string(2 * 4096, 'x')); }, true},
      {"half a file", [&] { fs::resize_file(path_, fs::file_size(path_) / 2); }, true},
      {"without its table", [&] { execute("DROP TABLE note"); }, false},
      {"with another column",
       [&] { execute("UPDATE sqlite_master SET sql = replace(sql, 'NOT NULL', '')"); }, true},
  };
  for (const Case& one : cases) {
    SCOPED_TRACE(one.what);
    fs::remove_all(path_.parent_path());
    const auto error = open()->file.change([&](SQLiteDatabase& database) -> Failure {
      for (int row = 0; row < rows; ++row)
        if (auto failure = Notebook::insert(database, std::to_string(row) + std::string(40, '.')))
          return failure;
      return std::nullopt;
    });
    ASSERT_FALSE(error);
    emptyLog();
    one.act();
    auto book = open();
    EXPECT_EQ(book->add("new"), "kept");
    EXPECT_EQ(book->log.lines.size(), 1u) << testing::PrintToString(book->log.lines);
    EXPECT_TRUE(fs::exists(beside(".damaged")));
    EXPECT_FALSE(fs::exists(beside(".salvage")));
    const auto count = [](Notebook& asked) {
      std::int64_t found = 0;
      EXPECT_FALSE(asked.file.read([&](SQLiteDatabase& database) {
        return database.row("SELECT count(*) FROM note", std::tie(found));
      }));
      return found;
    };
    EXPECT_GE(count(*book), one.isSalvaged ? rows / 4 : 1);
    EXPECT_EQ(count(*open()), count(*book));
    EXPECT_EQ(open()->file.damageCount(), 1);
    book->file.removeSetAside();
    EXPECT_FALSE(fs::exists(beside(".damaged")));
  }
}

TEST_P(DurableFileTest, FourProcessesThatFindDamageAtOnceLoseNothing) {
  for (int round = 0; round < (hasLog() ? 10 : 2); ++round) {
    fs::remove_all(path_.parent_path());
    inChild(::geteuid(), [&] {
      EXPECT_EQ(open()->add("old"), "kept");
      emptyLog();
    });
    overwrite(path_, 0, std::string(100, 'x'));
    int start[2];
    ASSERT_EQ(::pipe(start), 0);
    std::vector<pid_t> children;
    for (char name = 'a'; name < 'e'; ++name) {
      children.push_back(::fork());
      if (children.back() != 0) continue;
      ::close(start[1]);
      char byte = 0;
      static_cast<void>(::read(start[0], &byte, 1));
      auto book = open();
      for (char number = 'a'; number < 'i'; ++number)
        while (book->add(std::string{name, number}) == "busy") continue;
      ::_exit(static_cast<int>(book->log.lines.size()));
    }
    ::close(start[0]);
    ::close(start[1]);
    int lines = 0;
    for (const pid_t child : children) {
      int status = 0;
      ::waitpid(child, &status, 0);
      lines += WEXITSTATUS(status);
    }
    EXPECT_EQ(lines, 1);
    inChild(::geteuid(), [&] {
      auto book = open();
      EXPECT_EQ(book->keys().size(), 4u * 8 * 2);
      EXPECT_EQ(book->file.damageCount(), 1);
    });
  }
}

TEST_P(DurableFileTest, AKillWhileDamageIsMendedLosesNothing) {
  int call = 0;
  for (bool isKilled = true; isKilled;) {
    SCOPED_TRACE(++call);
    fs::remove_all(path_.parent_path());
    inChild(::geteuid(), [&] {
      EXPECT_EQ(open()->add("a"), "kept");
      emptyLog();
      auto database = SQLiteDatabase::open(path_, SQLiteDatabase::Access::existing);
      EXPECT_FALSE(
          database->execute("CREATE TABLE more(data); INSERT INTO more VALUES("
                            "zeroblob(30000))"));
      emptyLog();
      // Rows behind the damage are in the log alone.
      EXPECT_EQ(open()->add("b"), "kept");
    });
    fs::resize_file(path_, fs::file_size(path_) - 8192);
    const pid_t child = ::fork();
    if (child == 0) {
      const auto own = POSIX::makePrivateFiles();
      Platform::Testing::FaultyPrivateFiles files(*own);
      files.faults->plan(Platform::Testing::Fault::fails, static_cast<std::size_t>(call));
      files.whenStruck = [] { ::raise(SIGKILL); };
      Notebook book(path_, notes(GetParam()), Migrating::allowed, &files);
      ::_exit(book.add("c") == "kept" ? 0 : 1);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    isKilled = WIFSIGNALED(status);
    EXPECT_TRUE(isKilled || WEXITSTATUS(status) == 0);
    inChild(::geteuid(), [&] {
      auto book = open();
      EXPECT_EQ(book->add("d"), "kept");
      EXPECT_EQ(book->keys(), isKilled && book->keys() == "abd" ? "abd" : "abcd");
      EXPECT_EQ(open()->keys(), book->keys());
      EXPECT_FALSE(fs::exists(beside(".salvage")));
      const auto times = book->file.damageCount();
      EXPECT_TRUE(times == 1 || (isKilled && times == 2)) << times;
    });
  }
  EXPECT_GT(call, 20);
}

TEST_P(DurableFileTest, ACallToTheSystemThatFailsLosesNothing) {
  for (const auto fault : {Platform::Testing::Fault::fails, Platform::Testing::Fault::absent}) {
    bool isStruck = true;
    for (std::size_t call = 1; isStruck; ++call) {
      SCOPED_TRACE(call);
      fs::remove_all(path_.parent_path());
      const auto own = POSIX::makePrivateFiles();
      Platform::Testing::FaultyPrivateFiles files(*own);
      Notebook book(path_, notes(GetParam()), Migrating::allowed, &files);
      files.faults->plan(fault, call, 1);
      isStruck = false;
      files.whenStruck = [&] { isStruck = true; };
      std::string kept;
      for (const char* key : {"a", "b", "c"}) {
        if (book.add(key) == "kept") kept += key;
        if (*key == 'a') fs::remove(path_);
      }
      EXPECT_EQ(book.add("d"), "kept");
      const std::string found = book.keys();
      for (const char key : kept + "d") EXPECT_NE(found.find(key), found.npos) << found;
      EXPECT_EQ(open()->keys(), found);
    }
  }
}

TEST_P(DurableFileTest, NobodyWaitsLongForALockOfAnother) {
  ASSERT_EQ(open()->add("a"), "kept");
  std::unique_ptr<FileLock> lock;
  std::optional<SQLiteDatabase> database;
  const OtherProcess writer([&] {
    database = std::move(*SQLiteDatabase::open(path_, SQLiteDatabase::Access::existing));
    return !database->execute("BEGIN EXCLUSIVE");
  });
  ASSERT_TRUE(writer.isReady());
  auto book = open();
  const auto begin = std::chrono::steady_clock::now();
  for (int time = 0; time < 5; ++time) {
    EXPECT_EQ(book->add("b"), "busy");
    EXPECT_EQ(book->change("c"), "busy");
  }
  const OtherProcess opener([&] {
    lock = std::move(*POSIX::makePrivateFiles()->tryLock(beside(".opening")));
    return lock != nullptr;
  });
  ASSERT_TRUE(opener.isReady());
  EXPECT_EQ(open()->add("d"), "busy");
  // Eleven times 20 ms, and time for a machine that has much to do.
  EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(2));
  EXPECT_TRUE(book->log.lines.empty());
}

TEST_P(DurableFileTest, ASecondObjectOfTheProcessLeavesTheLocksOfTheFirst) {
  ASSERT_EQ(open()->add("a"), "kept");
  int ask[2];
  ASSERT_EQ(::pipe(ask), 0);
  int answer[2];
  ASSERT_EQ(::pipe(answer), 0);
  const pid_t other = ::fork();
  if (other == 0) {
    char byte = 0;
    static_cast<void>(::read(ask[0], &byte, 1));
    byte = open()->change("x") == "busy" ? 1 : 0;
    static_cast<void>(::write(answer[1], &byte, 1));
    ::_exit(0);
  }
  char isLocked = 0;
  EXPECT_FALSE(open()->file.change([&](SQLiteDatabase& database) {
    open()->keys();
    EXPECT_EQ(open()->change("c"), "busy");
    char byte = 0;
    EXPECT_EQ(::write(ask[1], &byte, 1), 1);
    EXPECT_EQ(::read(answer[0], &isLocked, 1), 1);
    return Notebook::insert(database, "b");
  }));
  ::waitpid(other, nullptr, 0);
  EXPECT_EQ(isLocked, 1);
  EXPECT_EQ(open()->keys(), "ab");
}

TEST_P(DurableFileTest, AForkedChildLeavesTheFileToItsParent) {
  auto book = open();
  ASSERT_EQ(book->add("a"), "kept");
  inChild(::geteuid(), [&] {
    EXPECT_EQ(book->add("x"), "refused");
    book.reset();
  });
  EXPECT_EQ(book->add("b"), "kept");
  EXPECT_EQ(book->keys(), "ab");
}

}  // namespace
}  // namespace Varnel::Tests
