// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/WatchedMainQueue.h>

#include <condition_variable>
#include <mutex>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform {

struct WatchedMainQueue::FirstRun {
  std::mutex mutex;  // Owns hasCome. The report is written under it, so that none follows the end.
  std::condition_variable came;
  bool hasCome = false;

  void come() {
    const std::lock_guard lock(mutex);
    hasCome = true;
    came.notify_all();
  }
  void reportUnlessItComes(SystemLog& systemLog, std::chrono::milliseconds patience) {
    std::unique_lock lock(mutex);
    if (came.wait_for(lock, patience, [this] { return hasCome; })) return;
    systemLog.write(
        "Nothing has run the main queue so far: notifications, sounds and progress wait for it. A "
        "host whose main loop does not run it has to, by its descriptor.");
  }
};

WatchedMainQueue::WatchedMainQueue(std::unique_ptr<MainQueue> queue, SystemLog& systemLog,
                                   std::chrono::milliseconds patience)
    : queue_(std::move(queue)),
      systemLog_(systemLog),
      patience_(patience),
      firstRun_(std::make_shared<FirstRun>()) {}

WatchedMainQueue::~WatchedMainQueue() {
  firstRun_->come();
}

void WatchedMainQueue::post(Block block) {
  if (!isWatched_.load(std::memory_order_relaxed) && !isWatched_.exchange(true)) watch();
  queue_->post(std::move(block));
}

void WatchedMainQueue::watch() try {
  queue_->post([firstRun = firstRun_] { firstRun->come(); });
  startThread("queue-watch", [firstRun = firstRun_, &systemLog = systemLog_, patience = patience_] {
    firstRun->reportUnlessItComes(systemLog, patience);
  }).detach();
} catch (const std::system_error&) {
  // Without a free thread nothing is reported.
}

}  // namespace Varnel::Platform
