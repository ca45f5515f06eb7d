// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <utility>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>

namespace Varnel::GTK3 {

/// Lets other threads post blocks to the main queue for an object of the interface. Those that have
/// not run when the object goes are dropped, so that they may use the object freely:
///
///     class Window {
///       void scan() {
///         start([this, post = posts_.sender()] { …; post([this] { showDone(); }); });
///       }
///       OwnedPosts posts_;  // the last member, so that it goes first
///     };
///
/// It is made and destroyed on the main thread, where the blocks run, in the order of each sender's
/// thread. A sender may be copied, kept and called on any thread, also when the owner has gone; the
/// queue outlives it. Blocks must not throw.
class OwnedPosts final {
  struct Presence {};

 public:
  using Block = Platform::MainQueue::Block;

  class Sender final {
   public:
    /// Runs the block later, on the main thread, unless the owner has gone by then.
    void operator()(Block block) const {
      queue_->post([owner = owner_, block = std::move(block)] {
        if (!owner.expired()) block();
      });
    }

   private:
    friend class OwnedPosts;
    Sender(Platform::MainQueue& queue, std::weak_ptr<const Presence> owner)
        : queue_(&queue), owner_(std::move(owner)) {}

    Platform::MainQueue* queue_;
    std::weak_ptr<const Presence> owner_;
  };

  explicit OwnedPosts(Platform::MainQueue& queue = Platform::processPorts().mainQueue)
      : queue_(queue) {}
  OwnedPosts(const OwnedPosts&) = delete;
  OwnedPosts& operator=(const OwnedPosts&) = delete;

  [[nodiscard]] Sender sender() const { return {queue_, presence_}; }

  /// The same as the call of a sender.
  void post(Block block) const { sender()(std::move(block)); }

  /// Drops what has been posted so far and has not run. Senders made earlier post no more.
  void drop() { presence_ = std::make_shared<const Presence>(); }

 private:
  Platform::MainQueue& queue_;
  std::shared_ptr<const Presence> presence_ = std::make_shared<const Presence>();
};

}  // namespace Varnel::GTK3
