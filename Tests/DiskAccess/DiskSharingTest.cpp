// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <thread>

#include <Tests/DiskAccess/DiskReadingFixture.h>
#include <Varnel/Basalt/Digest.h>
#include <Varnel/Platform/Testing/FakeSessionBoard.h>

// What is seen of a manager's disks, and how queues of several processes share them.

namespace Varnel {
namespace {

using namespace Tests;
using Platform::SessionBoard;
using Waiters = DiskAccessSnapshot::Waiters;

const std::string stickName = Basalt::hexadecimal(Basalt::sha256("STICK"));

class DiskSharingTest : public DiskReadingFixture {
 protected:
  DiskSharingTest() {
    queue_.emplace(*manager_, DiskReadingQueue::Ports{.readingPriority = priority_,
                                                      .now = [this] { return now_.load(); },
                                                      .sharedPlaces = &board_});
  }
  ~DiskSharingTest() override { queue_.reset(); }

  /// Of the one disk on which somebody is; waits for the state that is asked for.
  DiskAccessSnapshot awaitSnapshot(const std::function<bool(const DiskAccessSnapshot&)>& isIt) {
    while (true) {
      const auto all = manager_->snapshots();
      if (all.size() == 1 && isIt(all.front())) return all.front();
      std::this_thread::yield();
    }
  }
  std::unique_ptr<SessionBoard::Place> takeStick() {
    return board_.takePlace(stickName, 1, SessionBoard::Wait::no);
  }

  Platform::Testing::FakeSessionBoard board_;
};

TEST_F(DiskSharingTest, ASnapshotShowsWhoIsThereAndWhoWaits) {
  EXPECT_TRUE(manager_->snapshots().empty());
  const auto before = std::chrono::steady_clock::now();
  DiskData* record = nullptr;
  std::thread([&] { record = begin(stickFile)->diskData().get(); }).join();
  const auto waitFor = [&](QoS qos) {
    return std::thread([this, qos] { DiskAccessGuard(begin(stickFile, {}, qos)); });
  };
  std::thread urgent = waitFor(QoS::userInteractive);
  std::thread lazy = waitFor(QoS::background);
  const auto disk = awaitSnapshot([](const auto& seen) {
    return seen.waiters == Waiters{1, 0, 0, 1};
  });
  EXPECT_EQ(disk.disk->uniqueID(), "STICK");
  EXPECT_EQ(disk.maxReaders, 1);
  ASSERT_EQ(disk.places.size(), 1u) << "a session that was dropped";
  EXPECT_EQ(disk.places[0].propose, "test");
  EXPECT_TRUE(disk.places[0].since >= before &&
              disk.places[0].since <= std::chrono::steady_clock::now());
  for (const auto& request : record->queue().sync([&] { return record->claimPendingRequests(); }))
    request->sema.signal();
  urgent.join();
  lazy.join();
}

TEST_F(DiskSharingTest, WhoWaitsForAnotherProcessKeepsNobodyOfItsOwnWaiting) {
  auto others = takeStick();
  const Task reader = submit(onStick(), done);
  board_.awaitWaiter(stickName);
  EXPECT_EQ(awaitSnapshot([](const auto& seen) { return seen.places.empty(); }).waitersForProcesses,
            (Waiters{0, 0, 1, 0}));
  const Session plain = begin(stickFile, 0);
  ASSERT_TRUE(plain);
  EXPECT_EQ(submit(onStick(), {.accessWaitingTimeout = -1}, never)->result(), Result::timedOut);
  others.reset();
  // The reader leaves the place that it now has to others while the session lasts.
  while (!(others = takeStick())) std::this_thread::yield();
  plain->endAccessing();
  others.reset();
  EXPECT_EQ(reader->result(), Result::read);
  awaitFreeStick();
  while (!takeStick()) std::this_thread::yield();
}

TEST_F(DiskSharingTest, DisksOfInventedNamesAreNotShared) {
  mount(archiveVolume);
  for (const URL& volume : {archiveVolume, URL::fileURLWithPath("/missing/"), stickVolume})
    EXPECT_EQ(submit(on(volume), done)->result(), Result::read);
  EXPECT_EQ(board_.placeNames(), std::set<std::string>{stickName});
}

}  // namespace
}  // namespace Varnel
