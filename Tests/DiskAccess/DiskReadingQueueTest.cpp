// SPDX-License-Identifier: MIT
#include <sys/wait.h>
#include <unistd.h>

#include <Tests/DiskAccess/DiskReadingFixture.h>
#include <Varnel/Basalt/MainQueueExecutor.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel {
namespace {

using namespace Tests;
using namespace std::chrono_literals;

using DiskReadingQueueTest = DiskReadingFixture;

TEST_F(DiskReadingQueueTest, NeverHasMoreReadersOnADiskThanItAdmits) {
  plugDisk("HDD-1", "sda1", "Rotational", archiveVolume);
  mount(archiveVolume);
  const auto disk = DiskAccessGuard(begin(archiveVolume))->diskData();
  std::mutex mutex;
  std::condition_variable changed;
  int inside = 0;
  int maxInside = 0;
  int mayLeave = 0;
  const auto visit = [&](Turn&) {
    std::unique_lock lock(mutex);
    maxInside = std::max(maxInside, ++inside);
    changed.notify_all();
    changed.wait(lock, [&] { return mayLeave > 0; });
    --mayLeave;
    --inside;
    return Next::done();
  };
  std::vector<Task> tasks;
  for (int i = 0; i < 8; ++i)
    tasks.push_back(submit({.url = archiveVolume, .volumeURL = archiveVolume}, visit));
  awaitLines();
  const auto hasTwoInside = [&] {
    const std::lock_guard lock(mutex);
    return inside == 2 && mayLeave == 0;
  };
  while (!hasTwoInside()) std::this_thread::yield();
  manager_->setIsBackgroundMode(true);
  {
    const std::lock_guard lock(mutex);
    mayLeave = 1;
    changed.notify_all();
  }
  // One that came before the mode leaves, and nobody takes its place.
  while (accessCount(*disk) > 1) {
    ASSERT_FALSE(hasTwoInside());
    std::this_thread::yield();
  }
  {
    std::unique_lock lock(mutex);
    mayLeave = 1;
    changed.notify_all();
    changed.wait(lock, [&] { return inside == 1 && mayLeave == 0; });
    mayLeave = 5;
    maxInside = 1;
    changed.notify_all();
    changed.wait(lock, [&] { return mayLeave == 0; });
    EXPECT_EQ(maxInside, 1);
    manager_->setIsBackgroundMode(false);
    mayLeave = 1;
    changed.notify_all();
  }
  for (const Task& task : tasks) EXPECT_EQ(task->result(), Result::read);
}

TEST_F(DiskReadingQueueTest, ReadsOnItsWayUpTheDiskOrInTheOrderOfComing) {
  using Places = std::vector<std::optional<std::uint64_t>>;
  const Places places{50, 10, std::nullopt, 30, 70, 30};
  const auto orderOn = [&](const URL& volume, std::uint64_t from) {
    manager_->setIsBackgroundMode(true);  // One at a time on any disk.
    std::mutex mutex;
    Places order;
    std::vector<Task> tasks;
    std::latch isIn(1);
    std::latch mayGo(1);
    const auto add = [&](std::optional<std::uint64_t> place, bool isFirst) {
      tasks.push_back(
          submit({.url = volume, .volumeURL = volume, .place = place}, [&, place, isFirst](Turn&) {
            if (isFirst) {
              isIn.count_down();
              mayGo.wait();
            }
            const std::lock_guard lock(mutex);
            order.push_back(place);
            return Next::done();
          }));
    };
    add(from, true);
    isIn.wait();
    for (const auto& place : places) add(place, false);
    // Of the disk that is not in question.
    DiskReadingFile other{.url = stickFile, .volumeURL = stickVolume};
    if (volume == stickVolume) other = {.url = homeFile, .volumeURL = homeVolume};
    EXPECT_EQ(submit(other, [](Turn&) { return Next::done(); })->result(), Result::read);
    mayGo.count_down();
    for (const Task& task : tasks) EXPECT_EQ(task->result(), Result::read);
    return order;
  };
  EXPECT_EQ(orderOn(stickVolume, 40), (Places{40, 50, 70, std::nullopt, 10, 30, 30}));
  Places asTheyCame = places;
  asTheyCame.insert(asTheyCame.begin(), 40);
  EXPECT_EQ(orderOn(homeVolume, 40), asTheyCame);
}

// On a disk that seeks and on one that does not, in one class.
TEST_F(DiskReadingQueueTest, NobodyWaitsForTheLastTurnOfAnother) {
  struct Case {
    URL volume;
    std::optional<std::uint64_t> place;  ///< Of both that need many turns.
    std::optional<std::uint64_t> placeOfOther;
  };
  const Case cases[] = {{stickVolume, std::nullopt, 10},
                        {stickVolume, 50, 10},
                        {homeVolume, std::nullopt, std::nullopt}};
  manager_->setIsBackgroundMode(true);
  for (const Case& one : cases) {
    const auto at = [&](std::optional<std::uint64_t> where) {
      return DiskReadingFile{.url = one.volume, .volumeURL = one.volume, .place = where};
    };
    std::latch isIn(1);
    std::latch mayGo(1);
    std::atomic<bool> hasOtherRun = false;
    std::atomic<int> turns = 0;
    const auto longOne = [&](Turn&) {
      isIn.count_down(isIn.try_wait() ? 0 : 1);
      mayGo.wait();
      return hasOtherRun || ++turns == 1000 ? Next::done() : Next::again(one.place);
    };
    const Task first = submit(at(one.place), longOne);
    isIn.wait();
    const Task second = submit(at(one.place), longOne);
    const Task other = submit(at(one.placeOfOther), [&](Turn&) {
      hasOtherRun = true;
      return Next::done();
    });
    const bool isHome = one.volume == homeVolume;
    EXPECT_EQ(submit({.url = isHome ? stickFile : homeFile,
                      .volumeURL = isHome ? stickVolume : homeVolume},
                     [](Turn&) { return Next::done(); })
                  ->result(),
              Result::read);
    mayGo.count_down();
    for (const Task& task : {first, second, other}) EXPECT_EQ(task->result(), Result::read);
    EXPECT_LE(turns, 4) << one.volume.path();
  }
}

TEST_F(DiskReadingQueueTest, AMoreUrgentReaderWaitsForOneTurn) {
  // A reader of the queue, and a session of the process.
  std::atomic<bool> hasUrgentRun = false;
  Task urgent;
  Session session;
  std::thread other;
  int turns = 0;
  const Task background = submit(onStick(), {.qos = QoS::background}, [&](Turn& turn) {
    switch (++turns) {
      case 1:
        urgent = submit(onStick(), {.qos = QoS::userInteractive}, [&](Turn&) {
          hasUrgentRun = true;
          return Next::done();
        });
        awaitLines();
        break;
      case 2: {
        EXPECT_TRUE(hasUrgentRun);
        other = std::thread([&] {
          session = begin(stickFile, {}, QoS::userInteractive);
          session->endAccessing();
        });
        awaitRequests(*DiskAccessGuard(begin(stickFile))->diskData(), 1);
        break;
      }
      default:
        other.join();
        return Next::done();
    }
    EXPECT_FALSE(turn.isOver());
    now_ = now_.load() + Turn::maxTime;
    EXPECT_TRUE(turn.isOver());
    return Next::again();
  });
  EXPECT_EQ(background->result(), Result::read);
  EXPECT_EQ(turns, 3);
  EXPECT_EQ(urgent->result(), Result::read);
  EXPECT_TRUE(session);
}

TEST_F(DiskReadingQueueTest, AnUrgentReaderIsNotHeldUpByOneThatWaitsForAdmission) {
  const Session holder = begin(stickFile);
  std::vector<int> order;
  const auto note = [&](int number) {
    return [&order, number](Turn&) {
      order.push_back(number);
      return Next::done();
    };
  };
  const Task background = submit(onStick(), {.qos = QoS::background}, note(2));
  awaitRequests(*holder->diskData(), 1);
  const Task urgent = submit(onStick(), {.qos = QoS::userInteractive}, note(1));
  awaitRequests(*holder->diskData(), 2);
  holder->endAccessing();
  EXPECT_EQ(urgent->result(), Result::read);
  EXPECT_EQ(background->result(), Result::read);
  EXPECT_EQ(order, (std::vector{1, 2}));
}

TEST_F(DiskReadingQueueTest, LowClassesGiveWayToOtherPrograms) {
  const auto isLoweredIn = [&](QoS qos, std::shared_ptr<Basalt::Executor> executor) {
    bool isLowered = false;
    const Task task = submit(onStick(), {.qos = qos, .executor = std::move(executor)}, [&](Turn&) {
      isLowered = priority_.isLowered();
      return Next::done();
    });
    EXPECT_EQ(task->result(), Result::read);
    return isLowered;
  };
  for (const QoS qos : {QoS::background, QoS::utility}) EXPECT_TRUE(isLoweredIn(qos, nullptr));
  for (const QoS qos : {QoS::default_, QoS::userInitiated, QoS::userInteractive})
    EXPECT_FALSE(isLoweredIn(qos, nullptr));
  EXPECT_TRUE(isLoweredIn(QoS::background, Basalt::globalConcurrentQueue()));
  // The normal priority is not that of the thread which made the queue.
  priority_.set(priority_.lowered(0));
  queue_.emplace(*manager_, DiskReadingQueue::Ports{.readingPriority = priority_});
  EXPECT_FALSE(isLoweredIn(QoS::userInteractive, nullptr));
}

TEST_F(DiskReadingQueueTest, ATaskOnTheMainQueueHasThePlaceThere) {
  Platform::Testing::FakeMainQueue mainQueue;
  const auto executor = std::make_shared<Basalt::MainQueueExecutor>(mainQueue);
  int turns = 0;
  const Task task = submit(onStick(), {.executor = executor}, [&](Turn&) {
    EXPECT_TRUE(mainQueue.isCurrent());
    EXPECT_TRUE(DiskAccessGuard(begin(stickFile, 0))) << "the thread has a place already";
    return ++turns < 3 ? Next::again() : Next::done();
  });
  mainQueue.runWhile([&] { return !task->hasEnded(); });
  EXPECT_FALSE(priority_.isLowered());
  awaitFreeStick();
}

TEST_F(DiskReadingQueueTest, ABlockedMainQueueKeepsNoPlace) {
  Platform::Testing::FakeMainQueue mainQueue;
  const auto executor = std::make_shared<Basalt::MainQueueExecutor>(mainQueue);
  const Task onMain = submit(onStick(), {.executor = executor}, [](Turn&) { return Next::done(); });
  awaitLines();
  // The main thread waits for that very disk.
  DiskAccessGuard{begin(stickFile)};
  EXPECT_EQ(submit(onStick(), [](Turn&) { return Next::done(); })->result(), Result::read);
  mainQueue.runWhile([&] { return !onMain->hasEnded(); });
  EXPECT_EQ(onMain->result(), Result::read);
  // One that is put off can be stopped, and the block that comes late does nothing.
  std::stop_source source;
  const Task stopped = submit(onStick(), {.stop = source.get_token(), .executor = executor},
                              [](Turn&) { return Next::done(); });
  EXPECT_EQ(submit(onStick(), [](Turn&) { return Next::done(); })->result(), Result::read);
  source.request_stop();
  mainQueue.runWhile([&] { return !stopped->hasEnded(); });
  EXPECT_EQ(stopped->result(), Result::stopped);
}

/// Begins blocks when the test says so.
class LateExecutor final : public Basalt::Executor {
 public:
  void execute(Basalt::Block block) override {
    const std::lock_guard lock(mutex_);
    block_ = std::move(block);
    arrived_.notify_all();
  }
  Basalt::Block next() {
    std::unique_lock lock(mutex_);
    arrived_.wait(lock, [this] { return bool(block_); });
    return std::exchange(block_, {});
  }

 private:
  std::mutex mutex_;
  std::condition_variable arrived_;
  Basalt::Block block_;
};

TEST_F(DiskReadingQueueTest, AnExecutorThatIsAlwaysLateKeepsAPlaceNoLongerThanATurn) {
  const auto executor = std::make_shared<LateExecutor>();
  const Task late = submit(onStick(), {.executor = executor}, [](Turn&) { return Next::done(); });
  std::chrono::steady_clock::duration kept{};
  for (int offer = 0; offer < 6; ++offer) {
    Basalt::Block block = executor->next();
    const auto begin = std::chrono::steady_clock::now();
    awaitFreeStick();
    kept = std::chrono::steady_clock::now() - begin;
    block();
  }
  EXPECT_LT(kept, 25 * Turn::maxTime);
  while (!late->hasEnded()) executor->next()();
  EXPECT_EQ(late->result(), Result::read);
}

TEST_F(DiskReadingQueueTest, AnswersAStopAtOnceInEachState) {
  std::stop_source before;
  before.request_stop();
  const auto never = [](Turn&) {
    ADD_FAILURE() << "it was stopped";
    return Next::done();
  };
  EXPECT_EQ(submit(onStick(), {.stop = before.get_token()}, never)->result(), Result::stopped);

  std::stop_source inLine;
  const Holder holder = holdStick();
  const Task waiting = submit(onStick(), {.stop = inLine.get_token()}, never);
  awaitLines();
  inLine.request_stop();
  EXPECT_EQ(waiting->result(), Result::stopped);
  holder.letGo();
  awaitFreeStick();

  std::stop_source inAdmission;
  const Session session = begin(stickFile);
  const Task applying = submit(onStick(), {.stop = inAdmission.get_token()}, never);
  awaitRequests(*session->diskData(), 1);
  inAdmission.request_stop();
  EXPECT_EQ(applying->result(), Result::stopped);
  session->endAccessing();
  awaitFreeStick();

  std::stop_source inTurn;
  std::latch isIn(1);
  std::latch mayLeave(1);
  const Task running = submit(onStick(), {.stop = inTurn.get_token()}, [&](Turn& turn) {
    isIn.count_down();
    while (!turn.isOver()) std::this_thread::yield();
    mayLeave.wait();
    return Next::again();
  });
  isIn.wait();
  inTurn.request_stop();
  unmount(stickVolume);
  mayLeave.count_down();
  EXPECT_EQ(running->result(), Result::stopped) << "the first reason counts";
}

TEST_F(DiskReadingQueueTest, ASlowResultKeepsNoTimeOutWaiting) {
  struct SlowToEnd final : DiskReadingTask {
    std::latch isTold{1};
    std::latch mayEnd{1};
    DiskReadingNext run(Turn&) override { return Next::done(); }
    void didEnd(Result) override {
      isTold.count_down();
      mayEnd.wait();
    }
  };
  const Holder holder = holdStick();
  const auto slow = std::make_shared<SlowToEnd>();
  queue_->submit(slow, onStick(), {.accessWaitingTimeout = 0.001});
  slow->isTold.wait();
  const Task other = submit(
      onStick(), {.accessWaitingTimeout = 0.001, .executor = Basalt::globalConcurrentQueue()},
      [](Turn&) { return Next::done(); });
  EXPECT_EQ(other->result(), Result::timedOut);
  slow->mayEnd.count_down();
  holder.letGo();
}

TEST_F(DiskReadingQueueTest, SaysWhyNothingWasRead) {
  const Session session = begin(stickFile);
  const auto never = [](Turn&) {
    ADD_FAILURE();
    return Next::done();
  };
  for (const double timeout : {-1.0, 0.0, 0.001})
    EXPECT_EQ(submit(onStick(), {.accessWaitingTimeout = timeout}, never)->result(),
              Result::timedOut);
  const Task lost = submit(onStick(), never);
  const Task lostLater = submit({.url = stickFile}, never);
  const Task kept = submit({.url = homeFile}, [](Turn&) { return Next::done(); });
  EXPECT_EQ(kept->result(), Result::read);
  unmount(stickVolume);
  EXPECT_EQ(lost->result(), Result::vanished);
  EXPECT_NE(lostLater->result(), Result::read);
  session->endAccessing();
  volumes_.setLookupError(Platform::PlatformError("Test", 1));
  EXPECT_EQ(submit({.url = homeFile}, never)->result(), Result::unknownVolume);
  EXPECT_EQ(submit({.url = homeFile, .volumeURL = homeVolume}, {.accessWaitingTimeout = 0},
                   [](Turn&) { return Next::done(); })
                ->result(),
            Result::read)
      << "a free disk makes nobody wait";
}

TEST_F(DiskReadingQueueTest, AVolumeThatBecomesKnownIsCountedOnItsDisk) {
  const auto onArchive = [&](ScriptedTask::Run run) {
    return submit({.url = archiveVolume, .volumeURL = archiveVolume}, std::move(run));
  };
  std::latch mayGo(1);
  std::latch isIn(1);
  const Task holder = onArchive([&](Turn&) {
    isIn.count_down();
    mayGo.wait();
    return Next::done();
  });
  isIn.wait();
  EXPECT_FALSE(queue_->diskOfVolume(archiveVolume));
  std::string disk;
  const Task waiting = onArchive([&](Turn&) {
    disk = *DiskAccessGuard(manager_->beginAccessingURL(archiveVolume, "test", QoS::utility, false,
                                                        {}, archiveVolume))
                ->diskInfo()
                ->uniqueID();
    return Next::done();
  });
  awaitLines();
  plugDisk("HDD-1", "sda1", "Rotational", archiveVolume);
  volumes_.mount({.url = archiveVolume, .isLocal = {}, .isInternal = {}, .uuid = {}});
  EXPECT_TRUE(queue_->diskOfVolume(archiveVolume));
  mayGo.count_down();
  EXPECT_EQ(waiting->result(), Result::read);
  EXPECT_EQ(holder->result(), Result::read);
  EXPECT_EQ(disk, "HDD-1");
  EXPECT_EQ(queue_->diskOfVolume(archiveVolume)->uniqueID(), "HDD-1");
}

TEST_F(DiskReadingQueueTest, DestructionAnswersEverythingAndWaitsForCallbacks) {
  const Session session = begin(stickFile);
  const Task applying = submit(onStick(), [](Turn&) { return Next::done(); });
  awaitRequests(*session->diskData(), 1);
  std::latch isIn(1);
  bool hasLeft = false;
  const Task running = submit({.url = homeFile}, [&](Turn& turn) {
    isIn.count_down();
    while (!turn.isOver()) std::this_thread::yield();
    hasLeft = true;
    return Next::again();
  });
  isIn.wait();
  queue_.reset();
  EXPECT_TRUE(hasLeft);
  for (const Task& task : {applying, running}) {
    EXPECT_TRUE(task->hasEnded());
    EXPECT_EQ(task->result(), Result::stopped);
  }
  session->endAccessing();
  awaitFreeStick();
}

TEST_F(DiskReadingQueueTest, ACallbackMaySubmitAndDestroy) {
  Task other;
  const Holder holder = holdStick();
  const Task task = submit({.url = homeFile, .volumeURL = homeVolume}, [&](Turn&) {
    other = submit(onStick(), [](Turn&) { return Next::done(); });
    holder.letGo();
    EXPECT_EQ(other->result(), Result::read);
    queue_.reset();
    return Next::done();
  });
  EXPECT_EQ(task->result(), Result::read);
}

TEST_F(DiskReadingQueueTest, AForkedChildIsAnsweredWithinTheCall) {
  const Holder holder = holdStick();
  const pid_t child = ::fork();
  if (child == 0) {
    const Task task = submit(onStick(), [](Turn&) { return Next::done(); });
    bool isStopped = task->hasEnded() && task->result() == Result::stopped;
    queue_->read({onStick()}, {}, {}, [&](const DiskReadingFile&, DiskReadingResult result) {
      isStopped = isStopped && result == Result::stopped;
    });
    queue_.reset();
    ::_exit(isStopped ? 0 : 1);
  }
  int status = -1;
  ::waitpid(child, &status, 0);
  EXPECT_EQ(status, 0);
  holder.letGo();
}

}  // namespace
}  // namespace Varnel
