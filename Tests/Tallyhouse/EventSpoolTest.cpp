// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventSpool.h>

#include <sys/stat.h>

#include <fstream>

#include <Tests/Support/Crew.h>
#include <Tests/Tallyhouse/SpoolFixture.h>
#include <Varnel/Platform/Testing/FakeAppendFiles.h>

namespace Tallyhouse {
namespace {

namespace fs = std::filesystem;
using EventSpoolTest = Tests::SpoolFixture;

constexpr std::size_t many = 1000;

// What another process does with the file, until its end.
class Lock final {
 public:
  using Database = Varnel::Platform::SQLiteDatabase;

  Lock(const std::string& path, const std::string& sql)
      : database_(Database::open(path, Database::Access::readWrite).value()) {
    const auto error = database_->execute(sql);
    EXPECT_FALSE(error) << error->localizedDescription();
  }
  void end() { database_.reset(); }

 private:
  std::optional<Database> database_;
};

TEST_F(EventSpoolTest, KeepsWhatItTookInOrderAndForItsOwnerAlone) {
  {
    const auto spool = openSpool();
    append(*spool, {"a", "b", "c"});
    for (const char* suffix : {"", "-wal", "-shm"}) {
      struct stat facts {};
      ASSERT_EQ(::stat((path() + suffix).c_str(), &facts), 0);
      EXPECT_EQ(facts.st_mode & 0777, 0600u) << suffix;
    }
    spool->checkpoint();
    append(*spool, {"d"});
  }
  const auto spool = openSpool();
  EXPECT_EQ(namesOf(*spool), "a b c d ");
  EXPECT_EQ(spool->waiting(2, many).size(), 2u);
  EXPECT_EQ(spool->waiting(many, 8).size(), 2u);
  EXPECT_EQ(spool->waiting(many, 1).size(), 1u) << "a large event goes alone";
  EXPECT_EQ(spool->append("e", clock.now(), "ea=e"), 5);
  EXPECT_EQ(log.text(), "");
}

TEST_F(EventSpoolTest, WhatIsRefusedLeavesTheLineAndIsSetAsideAtLast) {
  const auto spool = openSpool();
  append(*spool, {"a", "b", "c"});
  const auto batch = spool->waiting(2, many);
  spool->moveToRefused(batch);
  EXPECT_EQ(namesOf(*spool), "c ");
  ASSERT_EQ(spool->refused(3)->uuid, "a");
  spool->countRefusal(*spool->refused(3));
  EXPECT_EQ(spool->refused(3)->uuid, "b") << "each gets its next try in turn";
  EXPECT_TRUE(spool->removeRefused(*spool->refused(3)));
  spool->countRefusal(*spool->refused(3));
  EXPECT_FALSE(spool->refused(3));
  EXPECT_FALSE(spool->backlog(3).hasRefused);
}

TEST_F(EventSpoolTest, DropsAndCountsTheOldestAtEitherLimit) {
  {
    const auto spool = openSpool({.maxEvents = 4, .maxBytes = 1000});
    append(*spool, {"a", "b", "c", "d"});
    spool->moveToRefused(spool->waiting(1, many));
    append(*spool, {"e", "f"});
    EXPECT_EQ(namesOf(*spool), "c d e f ");
    EXPECT_FALSE(spool->refused(3));
    EXPECT_EQ(spool->droppedCount(), 2);
    spool->append("large", clock.now(), std::string(990, 'x'));
    EXPECT_EQ(namesOf(*spool), "e f large ");
  }
  const auto spool = openSpool({.maxEvents = 2, .maxBytes = 1000});
  EXPECT_EQ(spool->droppedCount(), 4);
  append(*spool, {"g"});
  EXPECT_EQ(namesOf(*spool), "large g ");
  EXPECT_EQ(spool->droppedCount(), 6);
}

TEST_F(EventSpoolTest, ABatchThatWasClearedMeanwhileTakesNoNewEventWithIt) {
  const auto spool = openSpool();
  append(*spool, {"a", "b"});
  const auto batch = spool->waiting(many, many);
  spool->clear();
  append(*spool, {"c", "d"});
  EXPECT_TRUE(spool->removeWaiting(batch));
  spool->moveToRefused(batch);
  EXPECT_EQ(namesOf(*spool), "c d ");
  EXPECT_FALSE(spool->refused(3));
}

TEST_F(EventSpoolTest, ADamagedFileIsPutBesideAndAnUnusableFolderOnlyCounts) {
  fs::create_directories(folder.path() / "made");
  std::ofstream(path()) << std::string(5000, 'x');
  {
    const auto spool = openSpool();
    append(*spool, {"a"});
    EXPECT_EQ(namesOf(*spool), "a ");
    EXPECT_TRUE(fs::exists(path() + ".damaged"));
    spool->clear();
    EXPECT_FALSE(fs::exists(path() + ".damaged"));
  }
  std::ofstream(folder.path() / "file") << "no folder";
  EventSpool lost({*files, log}, (folder.path() / "file/Analytics.db").string(), {});
  append(lost, {"a", "b"});
  EXPECT_EQ(lost.droppedCount(), 2);
  EXPECT_EQ(namesOf(lost), "");
  const std::string text = log.text();
  EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 1) << text;
}

TEST_F(EventSpoolTest, AFileThatIsLockedOnlyDelays) {
  append(*openSpool(), {"a", "b"});
  Lock lock(path(), "PRAGMA locking_mode = EXCLUSIVE; BEGIN EXCLUSIVE");
  const auto late = openSpool();
  EXPECT_EQ(namesOf(*late), "");
  lock.end();
  append(*late, {"c"});
  EXPECT_EQ(namesOf(*late), "a b c ") << "the file was not taken for damaged";
  EXPECT_EQ(late->droppedCount(), 0);

  Lock writing(path(), "BEGIN IMMEDIATE");
  EXPECT_FALSE(late->removeWaiting(late->waiting(1, many)));
  late->moveToRefused(late->waiting(1, many));
  EXPECT_EQ(namesOf(*late), "a b c ");
  late->clear();
  EXPECT_FALSE(late->backlog(3).oldest) << "what is to be forgotten is not sent";
  writing.end();
  append(*late, {"d"});
  EXPECT_EQ(namesOf(*late), "d ");
}

TEST_F(EventSpoolTest, WhatIsRefusedIsNotLostWhenItCannotBeMoved) {
  const auto spool = openSpool();
  append(*spool, {"a", "b"});
  Lock other(path(),
             "CREATE TRIGGER full BEFORE INSERT ON refused WHEN NEW.uuid = 'b'"
             " BEGIN SELECT RAISE(ABORT, 'full'); END");
  spool->moveToRefused(spool->waiting(many, many));
  EXPECT_EQ(namesOf(*spool), "a b ");
  EXPECT_FALSE(spool->refused(3));
}

TEST_F(EventSpoolTest, TheLimitsHoldForAllThatShareAFile) {
  const auto one = openSpool({.maxEvents = 4, .maxBytes = 1000});
  const auto other = openSpool({.maxEvents = 4, .maxBytes = 1000});
  append(*one, {"a", "b", "c"});
  EXPECT_EQ(other->backlog(3).waiting, 3);
  append(*other, {"d", "e"});
  EXPECT_EQ(namesOf(*other), "b c d e ");
}

TEST_F(EventSpoolTest, ThreadsAndProcessesMayShareAFile) {
  const auto one = openSpool();
  const auto other = openSpool();
  constexpr int each = 200;
  Varnel::Tests::Crew threads(4, [&](unsigned i) {
    for (int n = 0; n < each; ++n) (i % 2 ? *one : *other).append("x", clock.now(), "ea=x");
  });
  std::size_t removed = 0;
  while (removed < 2 * each) {
    const auto batch = one->waiting(20, many);
    EXPECT_TRUE(one->removeWaiting(batch));
    removed += batch.size();
    one->checkpoint();
  }
  threads.join();
  const std::size_t left = other->waiting(10'000, 1 << 20).size();
  EXPECT_EQ(removed + left, 4u * each);
  EXPECT_EQ(one->droppedCount(), 0);
}

}  // namespace
}  // namespace Tallyhouse
