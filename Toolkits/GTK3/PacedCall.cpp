// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/PacedCall.h>
#include <glib.h>

#include <atomic>
#include <utility>

namespace Varnel::GTK3 {

class PacedCall::State final : public std::enable_shared_from_this<State> {
 public:
  State(Callback callback, std::chrono::milliseconds pause)
      : callback_(std::move(callback)), pause_(static_cast<guint>(pause.count())) {}

  void request() {
    if (isUnderWay_.exchange(true)) return;
    GSource* source = g_timeout_source_new(pause_);
    // Behind drawing: a source that is always ready ahead of it would keep the window from it.
    g_source_set_priority(source, G_PRIORITY_DEFAULT_IDLE);
    g_source_set_callback(source, &State::fire, new std::shared_ptr<State>(shared_from_this()),
                          [](gpointer self) { delete static_cast<std::shared_ptr<State>*>(self); });
    g_source_attach(source, nullptr);
    g_source_unref(source);
  }

  void cancel() { isWanted_ = false; }
  void want() { isWanted_ = true; }
  void disown() { callback_ = nullptr; }

 private:
  static gboolean fire(gpointer self) noexcept {
    // The callback may destroy the call, and make the last reference this one.
    const std::shared_ptr<State> state = *static_cast<std::shared_ptr<State>*>(self);
    // Before the callback: a request that comes while it runs is served by another call.
    state->isUnderWay_ = false;
    if (state->isWanted_.exchange(false) && state->callback_) {
      const Callback callback = state->callback_;
      callback();
    }
    return G_SOURCE_REMOVE;
  }

  Callback callback_;  // Main thread only.
  const guint pause_;
  std::atomic<bool> isWanted_ = false;    // Whether the next call is to call back.
  std::atomic<bool> isUnderWay_ = false;  // Whether a source waits in the main loop.
};

PacedCall::Requester::Requester(std::shared_ptr<State> state) : state_(std::move(state)) {}

void PacedCall::Requester::operator()() const {
  state_->want();
  state_->request();
}

PacedCall::PacedCall(Callback callback, std::chrono::milliseconds pause)
    : state_(std::make_shared<State>(std::move(callback), pause)) {}

PacedCall::~PacedCall() {
  state_->disown();
}

PacedCall::Requester PacedCall::requester() const {
  return Requester(state_);
}

void PacedCall::cancel() {
  state_->cancel();
}

}  // namespace Varnel::GTK3
