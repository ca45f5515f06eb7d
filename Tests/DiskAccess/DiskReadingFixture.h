// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <future>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include <Tests/DiskAccess/DiskAccessFixture.h>
#include <Varnel/Basalt/MainQueueExecutor.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeReadingPriority.h>

namespace Varnel::Tests {

using Next = DiskReadingNext;
using Result = DiskReadingResult;
using Turn = DiskReadingTurn;

/// A task that does what the test says.
class ScriptedTask final : public DiskReadingTask {
 public:
  using Run = std::function<DiskReadingNext(DiskReadingTurn&)>;
  explicit ScriptedTask(Run run) : run_(std::move(run)) {}

  DiskReadingNext run(DiskReadingTurn& turn) override { return run_(turn); }
  void didEnd(DiskReadingResult result) override { ended_.set_value(result); }  // throws if twice

  /// Waits for it.
  [[nodiscard]] DiskReadingResult result() { return result_.get(); }
  [[nodiscard]] bool hasEnded() const {
    return result_.wait_for(std::chrono::seconds(0)) == std::future_status::ready;
  }

 private:
  const Run run_;
  std::promise<DiskReadingResult> ended_;
  std::shared_future<DiskReadingResult> result_ = ended_.get_future().share();
};
using Task = std::shared_ptr<ScriptedTask>;

/// Beside the disk under /home/, a stick that admits one reader.
class DiskReadingFixture : public DiskAccessFixture {
 protected:
  DiskReadingFixture() {
    mountStick();
    queue_.emplace(*manager_, DiskReadingQueue::Ports{.readingPriority = priority_,
                                                      .now = [this] { return now_.load(); }});
  }

  static DiskReadingFile on(const URL& volume, std::optional<std::uint64_t> place = {}) {
    return {.url = volume, .volumeURL = volume, .place = place};
  }
  static DiskReadingFile onStick(std::optional<std::uint64_t> place = {}) {
    return {.url = stickFile, .volumeURL = stickVolume, .place = place};
  }

  /// Of the disk itself: the queue's threads may keep the manager too busy to look it up.
  Session begin(const URL& file, std::optional<double> timeout = {}, QoS qos = QoS::utility) {
    return beginOnKnownDisk(file, timeout, qos);
  }

  static Next done(Turn&) { return Next::done(); }
  static Next never(Turn&) {
    ADD_FAILURE() << "it must not run";
    return Next::done();
  }

  Task submit(DiskReadingFile file, DiskReadingOptions options, ScriptedTask::Run run) {
    auto task = std::make_shared<ScriptedTask>(std::move(run));
    queue_->submit(task, std::move(file), std::move(options));
    return task;
  }
  Task submit(DiskReadingFile file, ScriptedTask::Run run) {
    return submit(std::move(file), {}, std::move(run));
  }

  /// What was submitted with its volume before has reached the line of its disk: requests get there
  /// one after another. The other disk must be free.
  void awaitLines(const URL& other = homeVolume) {
    EXPECT_EQ(submit(on(other), done)->result(), Result::read);
  }

  /// A task that stays on its disk until it is let go.
  struct Holder {
    std::shared_ptr<std::latch> isIn = std::make_shared<std::latch>(1);
    std::shared_ptr<std::latch> mayGo = std::make_shared<std::latch>(1);
    Task task;
    void letGo() const {
      mayGo->count_down();
      EXPECT_EQ(task->result(), Result::read);
    }
  };
  Holder hold(DiskReadingFile file) {
    Holder holder;
    holder.task = submit(std::move(file), [holder](Turn&) {
      holder.isIn->count_down();
      holder.mayGo->wait();
      return Next::done();
    });
    holder.isIn->wait();
    return holder;
  }

  Holder holdStick() { return hold(onStick()); }

  std::size_t accessesTo(const URL& volume) {
    const DiskAccessGuard session(
        manager_->beginAccessingURL(volume, "test", QoS::utility, false, 0, volume));
    return session ? accessCount(*session->diskData()) - 1 : 1;
  }
  /// The queue gives its places back soon after a result.
  void awaitFreeStick() {
    while (accessesTo(stickVolume) > 0) std::this_thread::yield();
  }

  Platform::Testing::FakeMainQueue mainQueue_;
  const std::shared_ptr<Basalt::Executor> mainExecutor_ =
      std::make_shared<Basalt::MainQueueExecutor>(mainQueue_);
  Platform::Testing::FakeReadingPriority priority_;
  std::atomic<Turn::Clock::time_point> now_ = Turn::Clock::time_point();
  std::optional<DiskReadingQueue> queue_;
};

}  // namespace Varnel::Tests
