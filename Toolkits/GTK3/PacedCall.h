// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>

#include <Varnel/Platform/Api.h>

namespace Varnel::GTK3 {

/// Calls back on the main thread soon after it was asked to, once for all requests since the last
/// call, and behind input and drawing: however many requests come, the window stays alive.
/// `LatestValue` is made of this.
///
///     PacedCall update([this] { label.set_text(text()); });
///     start([request = update.requester()] { …; request(); });
///
/// Made, destroyed and called back on the main thread; requesters may be copied and called on any
/// thread, also when the object has gone. The callback must not throw.
class VARNEL_API PacedCall final {
  class State;

 public:
  using Callback = std::function<void()>;

  class VARNEL_API Requester final {
   public:
    void operator()() const;

   private:
    friend class PacedCall;
    explicit Requester(std::shared_ptr<State> state);

    std::shared_ptr<State> state_;
  };

  /// The callback comes one pause after the first request, so never more often than that.
  explicit PacedCall(Callback callback,
                     std::chrono::milliseconds pause = std::chrono::milliseconds(33));
  /// No call comes after this, nor does one that was asked for.
  ~PacedCall();
  PacedCall(const PacedCall&) = delete;
  PacedCall& operator=(const PacedCall&) = delete;

  [[nodiscard]] Requester requester() const;

  /// Takes requests back that were made before this.
  void cancel();

 private:
  std::shared_ptr<State> state_;
};

}  // namespace Varnel::GTK3
