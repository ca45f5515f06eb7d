// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/MainQueue.h>

#include <glib.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/ContextDescriptor.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

void destroy(GSource* source) {
  g_source_destroy(source);
  g_source_unref(source);
}

gboolean note(gpointer isOver) noexcept {
  *static_cast<bool*>(isOver) = true;
  return G_SOURCE_REMOVE;
}

// Posts to GLib's default main context, which GTK, Qt and plain hosts all run. Every block has a
// source of its own. So a nested loop, which a block runs, still reaches the other blocks.
class DefaultContextQueue final : public MainQueue {
 public:
  // GLib makes the context at its first use, whose thread the thread sanitizer could not tell from
  // others that use it at once.
  DefaultContextQueue() { g_main_context_default(); }
  ~DefaultContextQueue() override {
    while (g_source_remove_by_user_data(this)) {
    }
  }

  void post(Block block) override {
    {
      const std::lock_guard lock(mutex_);
      blocks_.push_back(std::move(block));
    }
    // Never g_main_context_invoke: it may run the block here and now.
    GSource* source = g_idle_source_new();
    g_source_set_priority(source, G_PRIORITY_DEFAULT);
    g_source_set_callback(source, &DefaultContextQueue::dispatch, this, nullptr);
    g_source_attach(source, nullptr);
    g_source_unref(source);
  }

  bool isCurrent() const override { return ::syscall(SYS_gettid) == ::getpid(); }

  void run() override {
    runWhile([this] { return stops_ == 0; });
    --stops_;
  }

  void stop() override {
    post([this] { ++stops_; });
  }

  void runWhile(const std::function<bool()>& condition) override {
    while (condition()) g_main_context_iteration(nullptr, TRUE);
  }

  bool runWhile(const std::function<bool()>& condition,
                std::chrono::milliseconds patience) override {
    if (patience.count() > G_MAXUINT) return runWhile(condition), true;
    bool isOver = false;
    const UniqueHandle<GSource*, destroy> timer(
        g_timeout_source_new(static_cast<guint>(std::max(patience.count(), {}))));
    g_source_set_callback(timer.get(), &note, &isOver, nullptr);
    g_source_attach(timer.get(), nullptr);
    bool holds = false;
    runWhile([&] { return (holds = condition()) && !isOver; });
    return !holds;
  }

  bool drain() override {
    bool any = false;
    while (g_main_context_iteration(nullptr, FALSE)) any = true;
    return any;
  }

  std::optional<int> descriptor() override {
    if (!descriptor_) descriptor_.emplace(g_main_context_default());
    return descriptor_->refreshed();
  }

 private:
  static gboolean dispatch(void* self) noexcept {
    static_cast<DefaultContextQueue*>(self)->runNext();
    return G_SOURCE_REMOVE;
  }

  void runNext() {
    std::unique_lock lock(mutex_);
    const Block block = std::move(blocks_.front());
    blocks_.pop_front();
    lock.unlock();
    block();
  }

  std::mutex mutex_;  // Owns blocks_, of which there are as many as sources.
  std::deque<Block> blocks_;
  // The members below belong to the main thread.
  int stops_ = 0;  // How many runs are to end. Main thread only.
  std::optional<ContextDescriptor> descriptor_;
};

}  // namespace

std::unique_ptr<MainQueue> makeMainQueue() {
  return std::make_unique<DefaultContextQueue>();
}

}  // namespace Varnel::Platform::Linux
