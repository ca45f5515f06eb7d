// SPDX-License-Identifier: MIT
// What becomes of events while the spool's file cannot be had, or is taken away.
#include <functional>

#include <Tests/Tallyhouse/SpoolFixture.h>

namespace Tallyhouse {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Haste = EventRecorder::Haste;
using Tests::OtherConnection;

using AwayTest = Tests::SpoolFixture;

// Whatever the reason: the file tells them apart, and the recorder holds the events of each.
TEST_F(AwayTest, WhileTheFileCannotBeHadEventsAreHeld) {
  const struct {
    const char* what;
    bool isSudden;  // Or there before the process is.
    const char* sql;
    const char* end;
  } cases[] = {
      {"written to", true, "BEGIN IMMEDIATE", "ROLLBACK"},
      {"locked as a whole", false, "PRAGMA locking_mode = EXCLUSIVE; BEGIN EXCLUSIVE", "ROLLBACK"},
      {"of a later format", false, "PRAGMA user_version = 2000", "PRAGMA user_version = 1000"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    fs::remove_all(fs::path(path()).parent_path());
    append(*openRecorder(), {"a"});
    clock.advance(1ms);
    std::unique_ptr<EventRecorder> recorder;
    if (c.isSudden) recorder = openRecorder({.maxHeldEvents = 100});
    if (c.isSudden) append(*recorder, {"b"});
    {
      OtherConnection other(path(), c.sql);
      if (!recorder) recorder = openRecorder({.maxHeldEvents = 100});
      const auto start = std::chrono::steady_clock::now();
      append(*recorder, {"given up"});
      for (int i = 0; i < 97; ++i) append(*recorder, {"x"});
      append(*recorder, {"c", "d", "e"});
      EXPECT_LT(std::chrono::steady_clock::now() - start, 1s) << "only the first waits";
      EXPECT_TRUE(recorder->settle(Haste::none));
      EXPECT_TRUE(recorder->counts(3).held > 0);
      EXPECT_FALSE(recorder->isAllDelivered());
      other.run(c.end);
    }
    EXPECT_FALSE(recorder->settle(Haste::none));
    append(*recorder, {"f"});
    const std::string found = names();
    EXPECT_TRUE(found.starts_with(c.isSudden ? "a b x " : "a x ")) << found;
    EXPECT_TRUE(found.ends_with("x c d e f ")) << found;
    EXPECT_EQ(recorder->counts(3).dropped, 1);
  }
}

TEST_F(AwayTest, WhatIsTakenAwayIsGivenBackByTheProcessesThatLive) {
  const struct {
    const char* what;
    std::function<void(const std::string& path)> take;
    const char* left;
  } cases[] = {
      {"the file is removed", [](const std::string& path) { fs::remove(path); }, "a b c d "},
      {"with its folder",
       [](const std::string& path) { fs::remove_all(fs::path(path).parent_path()); }, "a b c d "},
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
