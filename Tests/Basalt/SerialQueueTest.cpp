// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/SerialQueue.h>

#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <Tests/Support/Crew.h>
#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/Basalt/ThreadID.h>

namespace Basalt {
namespace {

using Log = std::vector<std::string>;

/// Keeps a queue busy with an `async` block until it is told to go on.
class Occupation final {
 public:
  explicit Occupation(SerialQueue& queue) {
    queue.async([gate = gate_, begun = begun_] {
      begun->signal();
      gate->wait();
    });
    begun_->wait();
  }
  void end() { gate_->signal(); }

 private:
  const std::shared_ptr<Semaphore> gate_ = std::make_shared<Semaphore>();
  const std::shared_ptr<Semaphore> begun_ = std::make_shared<Semaphore>();
};

TEST(SerialQueue, ChoosesTheThread) {
  SerialQueue queue("threads");
  const ThreadID here = currentThreadID();
  ThreadID asynchronous{};
  ThreadID submitted{};
  queue.async([&] { asynchronous = currentThreadID(); });
  queue.sync([&] {
    EXPECT_NE(asynchronous, here);
    EXPECT_EQ(currentThreadID(), here);
    EXPECT_TRUE(queue.isCurrent());
  });
  EXPECT_FALSE(queue.isCurrent());
  queue.submit([&] { submitted = currentThreadID(); });
  EXPECT_EQ(submitted, here) << "an idle queue runs a brief block at once";
}

TEST(SerialQueue, LeavesABriefBlockToWhoGivesTheQueueUp) {
  SerialQueue queue("brief");
  std::vector<ThreadID> runners;
  Semaphore isHeld, goOn;
  std::thread holder([&] {
    queue.sync([&] {
      isHeld.signal();
      goOn.wait();
    });
  });
  isHeld.wait();
  ThreadID actor{};
  queue.submit(
      [&] { queue.afterRelease([&] { queue.sync([&] { actor = currentThreadID(); }); }); });
  for (int i = 0; i < 20; ++i) queue.submit([&] { runners.push_back(currentThreadID()); });
  goOn.signal();
  holder.join();
  queue.sync([&] {
    EXPECT_EQ(actor, runners[0]) << "it acts after a brief block of another thread as well";
    ASSERT_EQ(runners.size(), 20u);
    EXPECT_NE(runners[0], currentThreadID());
    EXPECT_EQ(runners[14], runners[0]) << "the holder runs a fair share";
    EXPECT_NE(runners[15], runners[0]) << "and leaves the rest to the queue's own thread";
    EXPECT_EQ(runners[19], runners[15]);
  });
}

TEST(SerialQueue, RunsWhatABlockSubmitsOnceItHasEnded) {
  SerialQueue queue("nested");
  Log log;
  queue.sync([&] {
    queue.afterRelease([&] { queue.sync([&] { log.push_back("after release"); }); });
    queue.submit([&] {
      log.push_back("submitted");
      queue.submit([&] { log.push_back("submitted by the submitted"); });
    });
    log.push_back("block");
  });
  EXPECT_EQ(log, Log({"block", "submitted", "submitted by the submitted", "after release"}));

  log.clear();
  queue.sync([&] {
    queue.submit([&] { log.push_back("submitted"); });
    queue.async([&] { log.push_back("asynchronous"); });
    queue.submit([&] { log.push_back("submitted after it"); });
  });
  queue.sync([] {});
  EXPECT_EQ(log, Log({"submitted", "asynchronous", "submitted after it"}));
}

TEST(SerialQueue, IsDestroyedWithoutWaitingAndStillRunsWhatWasSubmitted) {
  auto queue = std::make_unique<SerialQueue>("destroyed");
  const auto done = std::make_shared<Semaphore>();
  Occupation occupation(*queue);
  queue->async([done] { done->signal(); });
  queue->submit([done] { done->signal(); });
  queue.reset();
  occupation.end();
  done->wait();
  done->wait();
}

TEST(SerialQueue, IsWaitedForByWhatAThreadDestroysLast) {
  SerialQueue queue("last words");
  struct LastWords {
    SerialQueue* queue = nullptr;
    ~LastWords() {
      if (!queue) return;
      queue->async([] {});
      queue->sync([] {});
    }
  };
  for (int round = 0; round < 20; ++round) {
    std::thread([&] {
      // Made before the thread first waits, it is destroyed after whatever it waited with.
      thread_local LastWords lastWords;
      lastWords.queue = &queue;
      Occupation occupation(queue);
      occupation.end();
      queue.sync([] {});
    }).join();
  }
  queue.sync([] {});
}

// Any mixture of calls from several threads: one block at a time, each thread's in their order, and
// none lost.
TEST(SerialQueue, KeepsItsPromisesUnderStress) {
  constexpr unsigned threadCount = 4;
  constexpr int callCount = 4000;
  for (unsigned round = 0; round < 3; ++round) {
    auto queue = std::make_shared<SerialQueue>("stress");
    struct State {
      std::vector<int> last = std::vector<int>(threadCount, -1);
      int running = 0;
      int blocks = 0;
      bool isInOrder = true;
    };
    const auto state = std::make_shared<State>();
    Varnel::Tests::Crew(threadCount, [&](unsigned thread) {
      std::minstd_rand random(round * threadCount + thread + 1);
      for (int call = 0; call < callCount; ++call) {
        const auto block = [state, thread, call] {
          if (++state->running != 1) state->isInOrder = false;
          if (std::exchange(state->last[thread], call) != call - 1) state->isInOrder = false;
          ++state->blocks;
          --state->running;
        };
        const unsigned kind = static_cast<unsigned>(random()) % 16;
        if (kind == 0) {
          queue->async(block);
        } else if (kind == 1) {
          queue->sync([&] { queue->submit(block); });
        } else if (kind == 2) {
          queue->async([block, owner = queue] { owner->submit(block); });
          queue->sync([] {});
        } else if (kind == 3) {
          EXPECT_THROW(queue->sync([&] {
            block();
            throw std::runtime_error("on purpose");
          }),
                       std::runtime_error);
        } else if (kind < 8) {
          queue->submit(block);
        } else {
          queue->sync(block);
        }
      }
    });
    queue->sync([&] {
      EXPECT_TRUE(state->isInOrder);
      EXPECT_EQ(state->blocks, 4 * callCount);
    });
  }
}

// Many short-lived queues: whoever gives a queue up last, on whatever thread, takes it down.
TEST(SerialQueue, ComesAndGoesUnderStress) {
  const auto finished = std::make_shared<Semaphore>();
  constexpr int rounds = 300;
  for (int round = 0; round < rounds; ++round) {
    auto queue = std::make_shared<SerialQueue>("short life");
    std::thread other([queue] { queue->sync([queue] { queue->submit([queue] {}); }); });
    queue->async([queue, finished] { queue->afterRelease([finished] { finished->signal(); }); });
    queue->submit([queue] {});
    queue->sync([&] { queue.reset(); });
    other.join();
  }
  for (int round = 0; round < rounds; ++round) finished->wait();
}

TEST(SerialQueueDeathTest, StopsCodeOnTheWrongQueue) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_DEATH(
      {
        SerialQueue queue("own queue");
        queue.sync([&] { queue.sync([] {}); });
      },
      "own queue");
  const auto runElsewhere = [] {
    const SerialQueue queue("other queue");
    QNAssertOnQueue(queue);
  };
  EXPECT_DEATH(runElsewhere(), "other queue");
  const auto runElsewhereUnheard = [&] {
    ::close(STDERR_FILENO);
    runElsewhere();
  };
  EXPECT_EXIT(runElsewhereUnheard(), testing::KilledBySignal(SIGABRT), "");
}

}  // namespace
}  // namespace Basalt
