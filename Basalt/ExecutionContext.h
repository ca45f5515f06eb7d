// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <utility>

#include <Varnel/Basalt/Executor.h>

namespace Basalt {

/// Base of objects that subscribe to channels. The handlers run on the object's executor and are
/// not called once the object is gone.
///
///     class Badge final : public ExecutionContext {
///      public:
///       explicit Badge(const Channel<int>& counts) : ExecutionContext(mainQueueExecutor) {
///         counts.onUpdate(*this, [this](int count) { draw(count); });
///       }
///     };
///
/// Destroy the object on its executor, or at a moment when the executor runs none of its handlers.
class ExecutionContext {
 public:
  ExecutionContext(const ExecutionContext&) = delete;
  ExecutionContext& operator=(const ExecutionContext&) = delete;

  [[nodiscard]] const std::shared_ptr<Executor>& executor() const { return executor_; }
  /// Expires with the object.
  [[nodiscard]] std::weak_ptr<const void> lifetime() const { return lifetime_; }

 protected:
  explicit ExecutionContext(std::shared_ptr<Executor> executor) : executor_(std::move(executor)) {}
  ~ExecutionContext() = default;

 private:
  const std::shared_ptr<Executor> executor_;
  const std::shared_ptr<const void> lifetime_ = std::make_shared<char>();
};

}  // namespace Basalt
