// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <utility>

#include <Varnel/Basalt/Block.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/QualityOfService.h>

namespace Basalt {

/// Runs blocks one at a time, and so owns the state that they touch.
///
///     SerialQueue queue("example.queue");
///     queue.async([state] { state->rebuild(); });                     // on the queue's own thread
///     const int count = queue.sync([&] { return state->count(); });  // here, after the rebuild
///
/// The blocks of one thread run in the order in which it submitted them, and so do those of threads
/// that wait for one another. While only `sync` calls wait, a newer one may overtake them.
///
/// Any thread may call any operation, on the queue or off it, unless it says otherwise. An idle
/// queue costs a `sync` about as much as a mutex. Destruction never waits, and may happen in a
/// block of the queue: submitted blocks still run, so blocks own what they touch. Blocks given to
/// `async`, `submit` and `afterRelease` must not throw.
class VARNEL_API SerialQueue final {
 public:
  using QualityOfService = Varnel::Platform::QualityOfService;

  /// The label names the queue's thread, which runs with the given quality of service.
  explicit SerialQueue(std::string label, QualityOfService quality = QualityOfService::default_);
  ~SerialQueue();
  SerialQueue(const SerialQueue&) = delete;
  SerialQueue& operator=(const SerialQueue&) = delete;

  [[nodiscard]] const std::string& label() const;

  /// Runs the block on the calling thread, after everything submitted before, and returns what it
  /// returns. An exception of the block reaches the caller after the queue has been given up. A
  /// call from a block of the same queue could never return and stops the process.
  template <typename Function>
  decltype(auto) sync(Function&& block) {
    const Hold hold(*core_);
    return std::forward<Function>(block)();
  }

  /// Runs the block later on the queue's own thread, which the first call starts. Throws
  /// `std::system_error`, having done nothing, when the system grants no thread.
  void async(Block&& block);

  /// Runs a brief block that takes no lock: at once if the queue is idle, otherwise on the thread
  /// that gives the queue up. From a block of the queue: as soon as that block has ended, before
  /// the queue is given up.
  void submit(Block&& block);

  /// From a block of the queue alone: whether blocks wait to run. If none does, a block may do at
  /// its end what it would submit there.
  [[nodiscard]] bool hasSubmittedBlocks() const;

  /// From a block of the queue alone: runs `block` on this thread once the queue has been given up.
  /// Use it to wake other threads: woken earlier, they would find the queue held.
  void afterRelease(Block&& block);

  /// Whether the calling code runs in a block of this queue.
  [[nodiscard]] bool isCurrent() const;

 private:
  class Core;

  class VARNEL_API Hold final {
   public:
    explicit Hold(Core& core);
    ~Hold();
    Hold(const Hold&) = delete;
    Hold& operator=(const Hold&) = delete;

   private:
    Core& core_;
  };

  Core* const core_;  ///< Deletes itself when the last block has run.
};

/// A queue for the framework's internal state.
[[nodiscard]] VARNEL_API std::shared_ptr<SerialQueue> QNBuildInternalDispatchQueue(
    std::string label);

/// Stops the process, in release builds too, unless the calling code runs in a block of `queue`.
VARNEL_API void QNAssertOnQueue(const SerialQueue& queue);

}  // namespace Basalt
