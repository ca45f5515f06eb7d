// SPDX-License-Identifier: MIT
#include <sys/wait.h>
#include <unistd.h>

#include <Tests/DiskAccess/DiskReadingFixture.h>

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
  int inside = 0, maxInside = 0, mayLeave = 0;
  const auto visit = [&](Turn&) {
    std::unique_lock lock(mutex);
    maxInside = std::max(maxInside, ++inside);
    changed.notify_all();
    changed.wait(lock, [&] { return mayLeave > 0; });
    --mayLeave;
    --inside;
    changed.notify_all();
    return Next::done();
  };
  std::vector<Task> tasks;
  for (int i = 0; i < 8; ++i) tasks.push_back(submit(on(archiveVolume), visit));
  awaitLines();
  const auto let = [&](int count, int stay) {
    std::unique_lock lock(mutex);
    mayLeave = count;
    changed.notify_all();
    changed.wait(lock, [&] { return inside == stay && mayLeave == 0; });
    return std::exchange(maxInside, stay);
  };
  EXPECT_EQ(let(0, 2), 2);
  manager_->setIsBackgroundMode(true);
  let(1, 1);
  // One that came before the mode is in, and nobody takes the place of the other.
  while (accessCount(*disk) > 1) {
    const std::lock_guard lock(mutex);
    ASSERT_LT(inside, 2);
  }
  let(1, 1);
  EXPECT_EQ(let(4, 1), 1);
  manager_->setIsBackgroundMode(false);
  let(2, 0);
  for (const Task& task : tasks) EXPECT_EQ(task->result(), Result::read);
}

TEST_F(DiskReadingQueueTest, ReadsOnItsWayUpTheDiskOrInTheOrderOfComing) {
  using Places = std::vector<std::optional<std::uint64_t>>;
  const Places places{50, 10, std::nullopt, 30, 70, 30};
  manager_->setIsBackgroundMode(true);  // One at a time on any disk.
  const auto orderOn = [&](const URL& volume, const URL& other) {
    Places order;
    std::vector<Task> tasks;
    const Holder first = hold(on(volume, 40));
    for (const auto& place : places)
      tasks.push_back(submit(on(volume, place), [&order, place](Turn&) {
        order.push_back(place);
        return Next::done();
      }));
    awaitLines(other);
    first.letGo();
    for (const Task& task : tasks) EXPECT_EQ(task->result(), Result::read);
    return order;
  };
  EXPECT_EQ(orderOn(stickVolume, homeVolume), (Places{50, 70, std::nullopt, 10, 30, 30}));
  EXPECT_EQ(orderOn(homeVolume, stickVolume), places);
}

// On a disk that seeks and on one that does not, in one class.
TEST_F(DiskReadingQueueTest, NobodyWaitsForTheLastTurnOfAnother) {
  using Place = std::optional<std::uint64_t>;
  struct Case {
    URL volume, other;
    Place place;  ///< Of both that need many turns.
    Place placeOfThird;
  };
  manager_->setIsBackgroundMode(true);
  for (const Case& one : {Case{stickVolume, homeVolume, {}, 10},
                          {stickVolume, homeVolume, 50, 10},
                          {homeVolume, stickVolume, {}, {}}}) {
    const Holder holder = hold(on(one.volume, one.place));
    std::atomic<bool> hasThirdRun = false;
    std::atomic<int> turns = 0;
    const auto longOne = [&](Turn&) {
      return hasThirdRun || ++turns == 1000 ? Next::done() : Next::again(one.place);
    };
    std::vector<Task> tasks;
    for (int i = 0; i < 2; ++i) tasks.push_back(submit(on(one.volume, one.place), longOne));
    tasks.push_back(submit(on(one.volume, one.placeOfThird), [&](Turn&) {
      hasThirdRun = true;
      return Next::done();
    }));
    awaitLines(one.other);
    holder.letGo();
    for (const Task& task : tasks) EXPECT_EQ(task->result(), Result::read);
    EXPECT_LE(turns, 4) << one.volume.path();
  }
}

TEST_F(DiskReadingQueueTest, AMoreUrgentReaderWaitsForOneTurn) {
  // A reader of the queue, and a session of the process.
  std::atomic<bool> hasUrgentRun = false;
  Task urgent;
  std::thread session;
  int turns = 0;
  const Task background = submit(onStick(), {.qos = QoS::background}, [&](Turn& turn) {
    if (++turns == 1) {
      urgent = submit(onStick(), {.qos = QoS::userInteractive}, [&](Turn&) {
        hasUrgentRun = true;
        return Next::done();
      });
      awaitLines();
    } else if (turns == 2) {
      EXPECT_TRUE(hasUrgentRun);
      session = std::thread([&] { begin(stickFile, {}, QoS::userInteractive)->endAccessing(); });
      awaitRequests(*DiskAccessGuard(begin(stickFile))->diskData(), 1);
    } else {
      session.join();
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
}

TEST_F(DiskReadingQueueTest, AnUrgentReaderIsNotHeldUpByOneThatWaitsForAdmission) {
  const Session holder = begin(stickFile);
  bool hasUrgentRun = false;
  const Task background = submit(onStick(), {.qos = QoS::background}, [&](Turn& turn) {
    EXPECT_TRUE(hasUrgentRun);
    return done(turn);
  });
  awaitRequests(*holder->diskData(), 1);
  const Task urgent = submit(onStick(), {.qos = QoS::userInteractive}, [&](Turn& turn) {
    hasUrgentRun = true;
    return done(turn);
  });
  awaitRequests(*holder->diskData(), 2);
  holder->endAccessing();
  EXPECT_EQ(urgent->result(), Result::read);
  EXPECT_EQ(background->result(), Result::read);
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
  int turns = 0;
  const Task task = submit(onStick(), {.executor = mainExecutor_}, [&](Turn&) {
    EXPECT_TRUE(mainQueue_.isCurrent());
    EXPECT_TRUE(DiskAccessGuard(begin(stickFile, 0))) << "the thread has a place already";
    return ++turns < 3 ? Next::again() : Next::done();
  });
  mainQueue_.runWhile([&] { return !task->hasEnded(); });
  EXPECT_FALSE(priority_.isLowered());
  awaitFreeStick();
}

TEST_F(DiskReadingQueueTest, ABlockedMainQueueKeepsNoPlace) {
  const Task onMain = submit(onStick(), {.executor = mainExecutor_}, done);
  awaitLines();
  // The main thread waits for that very disk, and no longer than about a turn.
  const auto start = std::chrono::steady_clock::now();
  DiskAccessGuard{begin(stickFile)};
  EXPECT_LT(std::chrono::steady_clock::now() - start, 25 * Turn::maxTime);
  EXPECT_EQ(submit(onStick(), done)->result(), Result::read);
  mainQueue_.runWhile([&] { return !onMain->hasEnded(); });
  EXPECT_EQ(onMain->result(), Result::read);
  // One that is put off can be stopped, and the block that comes late does nothing.
  std::stop_source source;
  const Task stopped =
      submit(onStick(), {.stop = source.get_token(), .executor = mainExecutor_}, done);
  EXPECT_EQ(submit(onStick(), done)->result(), Result::read);
  source.request_stop();
  mainQueue_.runWhile([&] { return !stopped->hasEnded(); });
  EXPECT_EQ(stopped->result(), Result::stopped);
}

TEST_F(DiskReadingQueueTest, AnswersAStopAtOnceInEachState) {
  const auto stopWhen = [&](ScriptedTask::Run run, auto isReady) {
    std::stop_source source;
    const Task task = submit(onStick(), {.stop = source.get_token()}, std::move(run));
    isReady();
    source.request_stop();
    return task;
  };
  std::stop_source before;
  before.request_stop();
  EXPECT_EQ(submit(onStick(), {.stop = before.get_token()}, never)->result(), Result::stopped);

  const Holder holder = holdStick();
  EXPECT_EQ(stopWhen(never, [&] { awaitLines(); })->result(), Result::stopped);
  holder.letGo();
  awaitFreeStick();

  const Session session = begin(stickFile);
  EXPECT_EQ(stopWhen(never, [&] { awaitRequests(*session->diskData(), 1); })->result(),
            Result::stopped)
      << "in admission";
  session->endAccessing();
  awaitFreeStick();

  std::latch isIn(1);
  std::latch mayLeave(1);
  const auto readOn = [&](Turn& turn) {
    isIn.count_down();
    while (!turn.isOver()) std::this_thread::yield();
    mayLeave.wait();
    return Next::again();
  };
  const Task running = stopWhen(readOn, [&] { isIn.wait(); });
  unmount(stickVolume);
  mayLeave.count_down();
  EXPECT_EQ(running->result(), Result::stopped) << "the first reason counts";
}

TEST_F(DiskReadingQueueTest, ASlowResultKeepsNoTimeOutWaiting) {
  const Holder holder = holdStick();
  std::latch isTold(1), mayEnd(1);
  queue_->read({onStick()}, {.accessWaitingTimeout = 0.001}, {},
               [&](const DiskReadingFile&, DiskReadingResult) {
                 isTold.count_down();
                 mayEnd.wait();
               });
  isTold.wait();
  const Task other =
      submit(onStick(),
             {.accessWaitingTimeout = 0.001, .executor = Basalt::globalConcurrentQueue()}, never);
  EXPECT_EQ(other->result(), Result::timedOut);
  mayEnd.count_down();
  holder.letGo();
  queue_.reset();  // The slow one uses what ends here.
}

TEST_F(DiskReadingQueueTest, SaysWhyNothingWasRead) {
  const Session session = begin(stickFile);
  for (const double timeout : {-1.0, 0.0, 0.001})
    EXPECT_EQ(submit(onStick(), {.accessWaitingTimeout = timeout}, never)->result(),
              Result::timedOut);
  const Task lost = submit(onStick(), never);
  const Task lostLater = submit({.url = stickFile}, never);
  EXPECT_EQ(submit({.url = homeFile}, done)->result(), Result::read);
  unmount(stickVolume);
  EXPECT_EQ(lost->result(), Result::vanished);
  EXPECT_NE(lostLater->result(), Result::read);
  session->endAccessing();
  volumes_.setLookupError(Platform::PlatformError("Test", 1));
  EXPECT_EQ(submit({.url = homeFile}, never)->result(), Result::unknownVolume);
  EXPECT_EQ(submit(on(homeVolume), {.accessWaitingTimeout = 0}, done)->result(), Result::read)
      << "a free disk makes nobody wait";
}

TEST_F(DiskReadingQueueTest, AVolumeThatBecomesKnownIsCountedOnItsDisk) {
  const Holder holder = hold(on(archiveVolume));
  EXPECT_FALSE(queue_->diskOfVolume(archiveVolume));
  std::string disk;
  const Task waiting = submit(on(archiveVolume), [&](Turn&) {
    disk = *DiskAccessGuard(manager_->beginAccessingURL(archiveVolume, "test", QoS::utility, false,
                                                        {}, archiveVolume))
                ->diskInfo()
                ->uniqueID();
    return Next::done();
  });
  awaitLines();
  plugDisk("HDD-1", "sda1", "Rotational", archiveVolume);
  volumes_.mount(plain(archiveVolume));
  EXPECT_TRUE(queue_->diskOfVolume(archiveVolume));
  holder.letGo();
  EXPECT_EQ(waiting->result(), Result::read);
  EXPECT_EQ(disk, "HDD-1");
  EXPECT_EQ(queue_->diskOfVolume(archiveVolume)->uniqueID(), "HDD-1");
}

TEST_F(DiskReadingQueueTest, DestructionAnswersEverythingAndWaitsForCallbacks) {
  const Session session = begin(stickFile);
  const Task applying = submit(onStick(), done);
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
  const Task task = submit(on(homeVolume), [&](Turn&) {
    other = submit(onStick(), done);
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
    const Task task = submit(onStick(), done);
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
