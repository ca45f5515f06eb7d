// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <deque>
#include <memory>
#include <utility>

#include <Varnel/Basalt/Block.h>
#include <Varnel/Basalt/Semaphore.h>

namespace Basalt {

/// Where a thread sleeps until a queue can be its own. Shared, because the thread that wakes it may
/// still be in `signal` when it has gone on.
struct Waiter {
  Semaphore wake;
  bool ownsQueue = false;  ///< Set before the wake-up. If not, the thread has to try again.
};

/// The blocks and threads that wait for a queue, each in its turn. One thread at a time.
class SerialQueueLine final {
 public:
  enum class Runner { anyThread, worker };
  struct Entry {
    Block block;
    Runner runner = Runner::anyThread;
    std::shared_ptr<Waiter> thread = nullptr;  ///< Instead of a block.
  };

  [[nodiscard]] bool isEmpty() const { return entries_.empty(); }
  [[nodiscard]] bool hasBlocks() const { return blockCount_ > 0; }
  [[nodiscard]] bool hasThreads() const { return entries_.size() > blockCount_; }

  enum class Place { front, back };
  void add(Entry&& entry, Place place = Place::back) {
    if (!entry.thread) ++blockCount_;
    entries_.insert(place == Place::front ? entries_.begin() : entries_.end(), std::move(entry));
  }

  /// The line must not be empty, as for `pop`.
  [[nodiscard]] const Entry& front() const { return entries_.front(); }
  Entry pop() {
    Entry entry = std::move(entries_.front());
    entries_.pop_front();
    if (!entry.thread) --blockCount_;
    return entry;
  }

 private:
  std::deque<Entry> entries_;
  std::size_t blockCount_ = 0;
};

}  // namespace Basalt
