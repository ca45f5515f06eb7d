// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <utility>

#include <Varnel/GTK3/PacedCall.h>

namespace Varnel::GTK3 {

/// Brings values from any thread to the main thread, and of those that came since the last time the
/// latest alone: for progress, which comes faster than it can be drawn.
///
///     LatestValue<Progress> progress_{
///         [this](const Progress& now) { bar_.set_fraction(now.part); }};
///     …
///     start([send = progress_.sender()] { …; send(now); });
///
/// Made and destroyed on the main thread, where `show` is called, some thirty times a second at
/// most and behind input and drawing. The last value sent always comes. A sender may be copied and
/// called on any thread, also when the object has gone. `show` must not throw.
template <typename Value>
class LatestValue final {
  struct Box {
    std::mutex mutex;  ///< Owns `value`.
    std::optional<Value> value;

    std::optional<Value> take() {
      const std::lock_guard lock(mutex);
      return std::exchange(value, std::nullopt);
    }
  };

 public:
  using Show = std::function<void(const Value& value)>;

  class Sender final {
   public:
    void operator()(Value value) const {
      {
        const std::lock_guard lock(box_->mutex);
        box_->value = std::move(value);
      }
      request_();
    }

   private:
    friend class LatestValue;
    Sender(std::shared_ptr<Box> box, PacedCall::Requester request)
        : box_(std::move(box)), request_(std::move(request)) {}

    std::shared_ptr<Box> box_;
    PacedCall::Requester request_;
  };

  explicit LatestValue(Show show) : show_(std::move(show)) {}
  LatestValue(const LatestValue&) = delete;
  LatestValue& operator=(const LatestValue&) = delete;

  [[nodiscard]] Sender sender() const { return {box_, call_.requester()}; }

  /// Shows at once what was sent and not yet shown, so that nothing older comes later.
  void flush() {
    call_.cancel();
    if (const auto value = box_->take()) show_(*value);
  }

 private:
  const Show show_;
  const std::shared_ptr<Box> box_ = std::make_shared<Box>();
  PacedCall call_{[this] { flush(); }};
};

}  // namespace Varnel::GTK3
