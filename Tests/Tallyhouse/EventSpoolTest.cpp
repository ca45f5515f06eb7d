// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/EventSpool.h>

#include <sys/stat.h>

#include <fstream>
#include <future>

#include <Tests/Tallyhouse/SpoolFixture.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Tallyhouse {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using EventSpoolTest = Tests::SpoolFixture;
using Haste = EventRecorder::Haste;
using Tests::OtherConnection;

bool isFound(const std::string& secret, const fs::path& folder) {
  for (const auto& entry : fs::directory_iterator(folder)) {
    const auto bytes = Varnel::Platform::readFile(entry.path());
    if (bytes && bytes->find(secret) != std::string::npos) return true;
  }
  return false;
}

TEST_F(EventSpoolTest, KeepsWhatItTookInOrderAndForItsOwnerAlone) {
  const auto recorder = openRecorder();
  append(*recorder, {"c", "b", "a"});
  clock.advance(-1h);
  append(*recorder, {"d"});
  for (const char* suffix : {"", "-wal", "-shm"}) {
    struct stat facts {};
    ASSERT_EQ(::stat((path() + suffix).c_str(), &facts), 0);
    EXPECT_EQ(facts.st_mode & 0777, 0600u) << suffix;
  }
  const auto spool = openSpool();
  EXPECT_EQ(namesOf(*spool), "c b a d ");
  EXPECT_EQ(spool->waiting(2, many).size(), 2u);
  EXPECT_EQ(spool->waiting(many, 8).size(), 2u);
  EXPECT_EQ(spool->waiting(many, 1).size(), 1u) << "a large event goes alone";
  EXPECT_EQ(spool->look("https://h.example", 2, 3)->backlog.waiting, 2);
  EXPECT_EQ(log.text(), "");
}

TEST_F(EventSpoolTest, AtAFirstStartNothingIsHeldButForAnothersLock) {
  using Varnel::Platform::Testing::Fault;
  Varnel::Platform::Testing::FaultyPrivateFiles faulty(*files);
  const auto faults = faulty.faults;
  EventRecorder recorder({faulty, clock, log}, path(), {});
  {
    const auto making = files->tryLock(path() + ".opening");
    ASSERT_TRUE(making && *making);
    recorder.begin();
    append(recorder, {"a"});
    EXPECT_EQ(recorder.counts(3).held, 1);
  }
  // The file is made, for one thread, and that takes its time.
  const std::size_t next = faults->calls() + 1;
  faults->plan(Fault::delays, next);
  auto settling = std::async(std::launch::async, [&] { return recorder.settle(Haste::none); });
  faults->waitForCalls(next);
  auto appending = std::async(std::launch::async, [&] {
    append(recorder, {"b"});
    return recorder.counts(3).held;
  });
  appending.wait_for(100ms);
  faults->mend();
  EXPECT_EQ(appending.get(), 0) << "nor what another thread appends meanwhile";
  EXPECT_FALSE(settling.get());
  EXPECT_EQ(names(), "a b ");
}

TEST_F(EventSpoolTest, WhatIsRefusedLeavesTheLineAndIsSetAsideAtLast) {
  append(*openRecorder(), {"a", "b", "c"});
  const auto spool = openSpool();
  const auto refuse = [&](std::vector<SpooledEvent> events) {
    clock.advance(1s);
    EXPECT_TRUE(spool->save({std::move(events), Verdict::refused, clock.now(), {}}));
  };
  refuse(spool->waiting(2, many));
  EXPECT_EQ(namesOf(*spool), "c ");
  EXPECT_EQ(spool->look("https://h.example", 1, 3)->backlog.refused, clock.now());
  for (const char* turn : {"a", "b", "a", "b"}) {
    const auto refused = spool->refused(3);
    ASSERT_EQ(refused.size(), 1u);
    EXPECT_EQ(refused[0].uuid, turn);
    refuse(refused);
  }
  EXPECT_TRUE(spool->refused(3).empty());
  EXPECT_FALSE(spool->look("https://h.example", 1, 3)->backlog.refused);
}

TEST_F(EventSpoolTest, WhatIsDeliveredIsToldOfEachProcessAlone) {
  const auto one = openRecorder();
  const auto other = openRecorder();
  const auto spool = openSpool();
  append(*other, {"first"});
  clock.advance(1ms);
  append(*one, {"refused"});
  clock.advance(1ms);
  append(*other, {"last"});
  const auto events = spool->waiting(many, many);
  ASSERT_EQ(events.size(), 3u);
  EXPECT_FALSE(other->isAllDelivered());
  auto others = events;
  for (SpooledEvent& event : others) event.uuid = "has this number now";
  for (const Verdict verdict : {Verdict::delivered, Verdict::refused})
    EXPECT_TRUE(spool->save({others, verdict, clock.now(), {}}));
  EXPECT_EQ(namesOf(*spool), "first refused last ");
  EXPECT_TRUE(spool->save({{events[1]}, Verdict::refused, clock.now(), {}}));
  EXPECT_TRUE(spool->save({{events[0], events[2]}, Verdict::delivered, clock.now(), {}}));
  EXPECT_TRUE(other->isAllDelivered());
  EXPECT_FALSE(one->isAllDelivered());
}

TEST_F(EventSpoolTest, WhatComesWhileTheDelivererLooksIsNotOverlooked) {
  const auto recorder = openRecorder();
  append(*recorder, {"a"});
  recorder->looking();
  EXPECT_EQ(recorder->append("b", clock.now(), "x"), 1) << "which wakes it";
  recorder->seen(30);
  EXPECT_EQ(recorder->append("c", clock.now(), "x"), 32);
}

TEST_F(EventSpoolTest, DropsAndCountsTheOldestAtEitherLimitWhoeverRecords) {
  const auto one = openRecorder({.maxEvents = 4});
  append(*one, {"a", "b", "c"});
  const auto spool = openSpool();
  EXPECT_TRUE(spool->save({spool->waiting(1, many), Verdict::refused, clock.now(), {}}));
  clock.advance(1ms);
  append(*openRecorder({.maxEvents = 4}), {"d", "e", "f"});
  EXPECT_EQ(namesOf(*spool), "c d e f ");
  EXPECT_TRUE(spool->refused(3).empty()) << "they count, too";
  EXPECT_EQ(one->counts(3).dropped, 2);

  const auto small = openRecorder({.maxBytes = 100 << 10});
  for (int i = 0; i < 200; ++i) small->append("large", clock.now(), std::string(5000, 'x'));
  EXPECT_LT(fs::file_size(path() + "-wal") + fs::file_size(path()), 8u << 20);
  const auto kept = spool->waiting(many, many << 20).size();
  EXPECT_GT(kept, 5u);
  EXPECT_LT(kept, 20u);
  EXPECT_EQ(small->counts(3).dropped, 6 + 200 - static_cast<std::int64_t>(kept));
  EXPECT_FALSE(one->isAllDelivered()) << "gone is not delivered";
}

TEST_F(EventSpoolTest, ARefusalOfConsentReachesWhatOtherProcessesHoldAndDo) {
  const auto one = openRecorder();
  const auto other = openRecorder();
  const auto spool = openSpool();
  append(*one, {"a"});
  append(*other, {"b"});
  const auto batch = spool->waiting(many, many);
  {
    OtherConnection lock(path(), "BEGIN IMMEDIATE");
    append(*other, {"held"});
    EXPECT_TRUE(other->counts(3).held > 0);
  }
  std::ofstream(path() + ".damaged") << "x";
  one->discard();
  EXPECT_FALSE(fs::exists(path() + ".damaged"));
  one->begin();
  append(*one, {"c"});
  EXPECT_FALSE(other->settle(Haste::none));
  append(*other, {"d"});
  EXPECT_EQ(namesOf(*spool), "c ") << "the other process asks before it records again";
  EXPECT_FALSE(other->isAllDelivered());
  for (const Verdict verdict : {Verdict::delivered, Verdict::refused})
    EXPECT_TRUE(spool->save({batch, verdict, clock.now(), {}}));
  EXPECT_EQ(namesOf(*spool), "c ") << "the batch on its way took nothing with it";
  EXPECT_TRUE(spool->refused(3).empty());
  other->begin();
  append(*other, {"e"});
  EXPECT_TRUE(spool->save({spool->waiting(many, many), Verdict::delivered, clock.now(), {}}));
  EXPECT_TRUE(one->isAllDelivered());
  EXPECT_FALSE(other->isAllDelivered()) << "\"d\" was given up";
  EXPECT_EQ(one->counts(3).dropped, 0);
  one->discard();
  append(*other, {"f"});
  EXPECT_EQ(namesOf(*spool), "") << "nor is there a short way past a refusal";
  EXPECT_EQ(other->append("g", clock.now(), "x"), 0);
  one->begin();

  const std::string secret = "Secret";
  append(*one, {secret});
  one->discard();
  EXPECT_FALSE(isFound(secret, fs::path(path()).parent_path()));
}

TEST_F(EventSpoolTest, ARefusalForgetsWhatIsThereAndMakesNothing) {
  const fs::path made = fs::path(path()).parent_path();
  const auto discard = [&] {
    EventRecorder recorder({*files, clock, log}, path(), {});
    recorder.discard();
    EXPECT_FALSE(recorder.mustEmpty());
  };
  discard();
  EXPECT_FALSE(fs::exists(made));
  for (const char* left : {"", "-wal", ".salvage", ".damaged"}) {
    fs::create_directory(made);
    std::ofstream(path() + left) << "Secret";
    discard();
    EXPECT_FALSE(isFound("Secret", made)) << left;
    fs::remove_all(made);
  }
  const auto recorder = openRecorder();
  append(*recorder, {"a"});
  fs::remove_all(made);
  recorder->discard();
  EXPECT_EQ(names(), "") << "nor is it given back";
}

TEST_F(EventSpoolTest, ARefusalThatTheFileDoesNotAllowYetIsMadeUpFor) {
  const auto recorder = openRecorder();
  const auto spool = openSpool();
  append(*recorder, {"Secret"});
  OtherConnection lock(path(), "BEGIN IMMEDIATE");
  recorder->discard();
  EXPECT_TRUE(recorder->mustEmpty());
  recorder->begin();
  lock.end();
  append(*recorder, {"b"});
  EXPECT_FALSE(recorder->settle(Haste::none));
  EXPECT_FALSE(isFound("Secret", fs::path(path()).parent_path()));
  EXPECT_EQ(namesOf(*spool), "b ");
  append(*recorder, {"c"});
  EXPECT_EQ(namesOf(*spool), "b c ");
}

}  // namespace
}  // namespace Tallyhouse
