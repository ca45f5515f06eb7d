// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <utility>
#include <vector>

#include <Basalt/ExecutionContext.h>
#include <Basalt/Executor.h>

namespace Basalt {

/// A stream of updates to subscribe to; a `Producer` sends them.
///
///     channel.onUpdate(context, [](const Event& event) { … });
///
/// A cheap value; copies are one channel. Any thread. Each update reaches everybody who subscribed
/// before it was sent, in the order of subscription; nothing is kept for those who come later.
/// Handlers may subscribe and end subscriptions, also of the update that is being delivered.
template <typename Update>
class Channel {
 public:
  using Handler = std::function<void(const Update&)>;

  Channel() : state_(std::make_shared<State>()) {}

  /// Subscribes until the context is gone.
  void onUpdate(const ExecutionContext& context, Handler handler) const {
    add({context.executor(), std::make_shared<const Handler>(std::move(handler)),
         context.lifetime()});
  }

  /// Subscribes for as long as there is a producer.
  void onUpdate(const Executor& executor, Handler handler) const {
    add({executor, std::make_shared<const Handler>(std::move(handler)), std::nullopt});
  }

  bool operator==(const Channel&) const = default;

 protected:
  struct Subscription {
    Executor executor;
    std::shared_ptr<const Handler> handler;
    std::optional<std::weak_ptr<const void>> lifetime;  ///< Absent: for ever.

    [[nodiscard]] bool hasEnded() const { return lifetime && lifetime->expired(); }
  };

  [[nodiscard]] std::vector<Subscription> subscriptions() const {
    const std::lock_guard lock(state_->mutex);
    return state_->subscriptions;
  }

 private:
  struct State {
    std::mutex mutex;  ///< Owns the list; not held while handlers run.
    std::vector<Subscription> subscriptions;
  };

  void add(Subscription subscription) const {
    std::vector<Subscription> ended;  // Let go after the lock: handlers may own anything.
    const std::lock_guard lock(state_->mutex);
    auto& all = state_->subscriptions;
    const auto firstEnded = std::stable_partition(
        all.begin(), all.end(), [](const Subscription& each) { return !each.hasEnded(); });
    std::move(firstEnded, all.end(), std::back_inserter(ended));
    all.erase(firstEnded, all.end());
    all.push_back(std::move(subscription));
  }

  std::shared_ptr<State> state_;
};

/// The sending end of a channel. A cheap value; any thread.
///
///     Producer<Event> producer;
///     producer.channel().onUpdate(Executor(mainQueue), handle);
///     producer.update(event);
template <typename Update>
class Producer final : private Channel<Update> {
 public:
  [[nodiscard]] Channel<Update> channel() const { return *this; }

  /// Hands the update to the executors of all who are subscribed now.
  void update(Update update) const {
    const auto shared = std::make_shared<const Update>(std::move(update));
    for (const auto& subscription : this->subscriptions()) {
      if (subscription.hasEnded()) continue;
      subscription.executor.execute([subscription, shared] {
        if (!subscription.hasEnded()) (*subscription.handler)(*shared);
      });
    }
  }
};

}  // namespace Basalt
