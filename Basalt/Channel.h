// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include <Varnel/Basalt/ExecutionContext.h>
#include <Varnel/Basalt/Executor.h>

namespace Basalt {

/// A stream of updates to subscribe to; a `Producer` sends them.
///
///     channel.onUpdate(context, [](const Event& event) { … });
///
/// A cheap value; copies are one channel. Any thread. Each update reaches everybody who subscribed
/// before it was sent, in the order of subscription; later subscribers miss it. Handlers may
/// subscribe and end subscriptions, also of the update that is being delivered.
template <typename Update>
class Channel {
 public:
  using Handler = std::function<void(const Update&)>;

  Channel() : state_(std::make_shared<State>()) {}

  /// Subscribes until the context is gone.
  void onUpdate(const ExecutionContext& context, Handler handler) const {
    add({context.executor(), std::move(handler), Lasts::asItsContext, context.lifetime()});
  }

  /// Subscribes for as long as there is a producer.
  void onUpdate(std::shared_ptr<Executor> executor, Handler handler) const {
    add({std::move(executor), std::move(handler), Lasts::forEver, {}});
  }

  bool operator==(const Channel&) const = default;

 protected:
  enum class Lasts { forEver, asItsContext };

  struct Subscription {
    std::shared_ptr<Executor> executor;
    Handler handler;
    Lasts lasts;
    std::weak_ptr<const void> lifetime;

    [[nodiscard]] bool hasEnded() const {
      return lasts == Lasts::asItsContext && lifetime.expired();
    }
  };
  using Subscriptions = std::vector<std::shared_ptr<const Subscription>>;

  [[nodiscard]] Subscriptions subscriptions() const {
    const std::lock_guard lock(state_->mutex);
    return state_->subscriptions;
  }

 private:
  struct State {
    std::mutex mutex;  ///< Owns the list; not held while handlers run.
    Subscriptions subscriptions;
  };

  void add(Subscription subscription) const {
    auto shared = std::make_shared<const Subscription>(std::move(subscription));
    Subscriptions kept;  // Ended ones are freed after the lock: their handlers may own anything.
    const std::lock_guard lock(state_->mutex);
    for (const auto& each : state_->subscriptions)
      if (!each->hasEnded()) kept.push_back(each);
    kept.push_back(std::move(shared));
    std::swap(kept, state_->subscriptions);
  }

  std::shared_ptr<State> state_;
};

/// The sending end of a channel. A cheap value; any thread.
///
///     Producer<Event> producer;
///     producer.channel().onUpdate(mainQueueExecutor, handle);
///     producer.update(event);
template <typename Update>
class Producer final : private Channel<Update> {
 public:
  [[nodiscard]] Channel<Update> channel() const { return *this; }

  /// Hands the update to the executors of all present subscriptions. An exception of an `execute`
  /// reaches the caller, and the subscriptions behind it then miss the update.
  void update(Update update) const {
    const auto shared = std::make_shared<const Update>(std::move(update));
    for (const auto& subscription : this->subscriptions()) {
      if (subscription->hasEnded()) continue;
      subscription->executor->execute([subscription, shared] {
        if (!subscription->hasEnded()) subscription->handler(*shared);
      });
    }
  }
};

}  // namespace Basalt
