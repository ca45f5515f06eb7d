// SPDX-License-Identifier: MIT
// What becomes of events while the spool's file cannot be had, or is taken away.
#include <sys/mount.h>

#include <fstream>
#include <functional>

#include <Tests/Support/AsUser.h>
#include <Tests/Tallyhouse/SpoolFixture.h>

namespace Tallyhouse {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Haste = EventRecorder::Haste;
using Tests::OtherConnection;

// What keeps the file away while it lives.
using Obstacle = std::shared_ptr<void>;

Obstacle until(std::function<void()> end) {
  return {nullptr, [end = std::move(end)](void*) { end(); }};
}

struct AwayCase {
  const char* what;
  bool isSudden;  // Or there before the process is.
  std::function<Obstacle(const std::string& path)> make;
  enum { none, ofRoot, ofAll } needsDisk = none;  // One of its own.
};

class AwayTest : public Tests::SpoolFixture {
 protected:
  // As this user and, where that is root, as an ordinary one too.
  bool expectAllIsWrittenLater(const AwayCase& c) {
    bool isDone = true;
    for (const uid_t user : Varnel::Tests::users()) {
      SCOPED_TRACE(c.what);
      const fs::path made = fs::path(path()).parent_path();
      fs::create_directories(made);
      for (const fs::path& owned : {made, folder.path()}) Varnel::Tests::give(owned, user);
      const bool needsDisk = c.needsDisk >= (user == 0 ? AwayCase::ofRoot : AwayCase::ofAll);
      isDone = Varnel::Tests::inChild(
                   user, [&] { writeLater(c); }, needsDisk ? made : fs::path()) &&
               isDone;
      fs::remove_all(made);
    }
    return isDone;
  }

 private:
  void writeLater(const AwayCase& c) {
    append(*openRecorder(), {"a"});
    clock.advance(1ms);
    std::unique_ptr<EventRecorder> recorder;
    if (c.isSudden) recorder = openRecorder({.maxHeldEvents = 100});
    if (c.isSudden) append(*recorder, {"b"});
    Obstacle obstacle = c.make(path());
    if (!recorder) recorder = openRecorder({.maxHeldEvents = 100});
    const auto start = std::chrono::steady_clock::now();
    append(*recorder, {"given up"});
    for (int i = 0; i < 97; ++i) append(*recorder, {"x"});
    append(*recorder, {"c", "d", "e"});
    EXPECT_LT(std::chrono::steady_clock::now() - start, 1s) << "only the first waits";
    const auto spool = openSpool();
    EXPECT_TRUE(recorder->settle(Haste::none));
    EXPECT_TRUE(recorder->counts(3).held > 0);
    EXPECT_FALSE(recorder->isAllDelivered());
    obstacle.reset();
    EXPECT_FALSE(recorder->settle(Haste::none));
    append(*recorder, {"f"});
    const std::string found = names();
    EXPECT_TRUE(found.starts_with(c.isSudden ? "a b x " : "a x ")) << found;
    EXPECT_TRUE(found.ends_with("x c d e f ")) << found;
    EXPECT_EQ(recorder->counts(3).dropped, 1);
  }
};

TEST_F(AwayTest, WhileTheFileIsLockedOrAnothersEventsAreHeld) {
  const auto lock = [](const char* sql) {
    return [sql](const std::string& path) -> Obstacle {
      return std::make_shared<OtherConnection>(path, sql);
    };
  };
  const auto instead = [](auto make) {
    return [make](const std::string& path) {
      const auto rename = [path](const char* from, const char* to) {
        for (const char* suffix : {"", "-wal"})
          fs::rename(path + from + suffix, path + to + suffix);
      };
      rename("", ".away");
      make(path);
      return until([path, rename] {
        fs::remove_all(path);
        rename(".away", "");
      });
    };
  };
  const AwayCase cases[] = {
      {"written to", true, lock("BEGIN IMMEDIATE")},
      {"locked as a whole", false, lock("PRAGMA locking_mode = EXCLUSIVE; BEGIN EXCLUSIVE")},
      {"a folder", false, instead([](const std::string& path) { fs::create_directory(path); })},
      {"a link", false,
       instead([](const std::string& path) { fs::create_symlink(path + ".away", path); })},
      {"another program's", false, instead([](const std::string& path) {
         OtherConnection(path, "PRAGMA application_id = 7; CREATE TABLE theirs(x)");
       })},
      {"of a later format", false,
       [](const std::string& path) {
         OtherConnection(path, "PRAGMA user_version = 2000");
         return until([path] { OtherConnection(path, "PRAGMA user_version = 1000"); });
       }},
  };
  for (const AwayCase& c : cases) EXPECT_TRUE(expectAllIsWrittenLater(c));
}

// An ordinary user cannot remount, and root can write whatever the mode is.
Obstacle protect(const std::string& path) {
  const fs::path made = fs::path(path).parent_path();
  if (::mount("", made.c_str(), nullptr, MS_REMOUNT | MS_RDONLY, "") == 0)
    return until([made] { EXPECT_EQ(::mount("", made.c_str(), nullptr, MS_REMOUNT, ""), 0); });
  const auto change = [made](fs::perms folder, fs::perms file) {
    fs::permissions(made, fs::perms::owner_all);
    for (const auto& entry : fs::directory_iterator(made)) fs::permissions(entry, file);
    fs::permissions(made, folder);
  };
  change(fs::perms(0500), fs::perms(0400));
  return until([change] { change(fs::perms(0700), fs::perms(0600)); });
}

TEST_F(AwayTest, WhileTheDiskIsFullOrReadOnlyEventsAreHeld) {
  const auto fill = [](const std::string& path) {
    std::ofstream(path + ".filler") << std::string(4 << 20, 'x');
    return until([path] { fs::remove(path + ".filler"); });
  };
  const AwayCase cases[] = {{"full", true, fill, AwayCase::ofAll},
                            {"full at first", false, fill, AwayCase::ofAll},
                            {"read-only", false, protect, AwayCase::ofRoot}};
  for (const AwayCase& c : cases)
    if (!expectAllIsWrittenLater(c)) GTEST_SKIP() << "no file system in memory";
}

TEST_F(AwayTest, WhatIsTakenAwayIsGivenBackByTheProcessesThatLive) {
  const struct {
    const char* what;
    std::function<void(const std::string& path)> take;
    const char* left;
  } cases[] = {
      {"the file is removed", [](const std::string& path) { fs::remove(path); }, "a b c d "},
      {"or moved", [](const std::string& path) { fs::rename(path, path + ".old"); }, "a b c d "},
      {"with its journal",
       [](const std::string& path) {
         for (const char* suffix : {"", "-wal", "-shm"}) fs::remove(path + suffix);
       },
       "a b c d "},
      {"the journal alone", [](const std::string& path) { fs::remove(path + "-wal"); }, "a b c d "},
      {"the folder", [](const std::string& path) { fs::remove_all(fs::path(path).parent_path()); },
       "a b c d "},
      {"or moved",
       [](const std::string& path) {
         const fs::path made = fs::path(path).parent_path();
         fs::remove_all(made.string() + ".old");
         fs::rename(made, made.string() + ".old");
       },
       "a b c d "},
      {"another spool stands there",
       [this](const std::string& path) {
         fs::rename(path, path + ".old");
         fs::rename(path + "-wal", path + ".old-wal");
         fs::remove(path + "-shm");
         append(*openRecorder(), {"other"});
       },
       "a b other c d "},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    // What is left of the case before, and was given back at its recorder's end.
    fs::remove_all(fs::path(path()).parent_path());
    const auto recorder = openRecorder();
    const auto spool = openSpool();
    append(*recorder, {"a", "b"});
    EXPECT_EQ(namesOf(*spool), "a b ");
    clock.advance(1ms);
    c.take(path());
    clock.advance(1ms);
    append(*recorder, {"c"});
    append(*recorder, {"d"});
    EXPECT_EQ(namesOf(*spool), c.left);
    EXPECT_EQ(names(), c.left);
  }
}

TEST_F(AwayTest, TheLastEventsAreCarriedOverWhenAskedForAndAtTheEnd) {
  const fs::path made = fs::path(path()).parent_path();
  auto recorder = openRecorder();
  append(*recorder, {"a"});
  fs::rename(made, made.string() + ".1");
  append(*recorder, {"b"});
  EXPECT_FALSE(recorder->isAllDelivered());
  EXPECT_EQ(names(), "a b ");
  clock.advance(1ms);
  fs::rename(made, made.string() + ".2");
  append(*recorder, {"c"});
  recorder.reset();
  EXPECT_EQ(names(), "a b c ");
}

}  // namespace
}  // namespace Tallyhouse
