// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

#include <Varnel/Basalt/Block.h>
#include <Varnel/Platform/Api.h>

namespace Basalt {

/// Runs blocks, somewhere and at some time. Any thread.
///
///     globalConcurrentQueue()->execute([tracker] { show(tracker->installSourceEntry()); });
class VARNEL_API Executor {
 public:
  virtual ~Executor() = default;

  /// Runs the block once, never within this call. It must not throw.
  virtual void execute(Block block) = 0;
};

/// The process's queue of default priority for work that may wait: blocks run side by side on
/// threads that are started as needed, 64 at most, and begin in the order of submission. Blocks
/// that still run or wait when the process ends are dropped. `execute` throws `std::system_error`
/// when the system grants not even one thread. Any thread.
[[nodiscard]] VARNEL_API std::shared_ptr<Executor> globalConcurrentQueue();

}  // namespace Basalt
