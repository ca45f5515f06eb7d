// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/MainLoop/MainLoopBlock.h>

#include <glib.h>

#include <mutex>
#include <utility>

namespace Varnel::Platform::Linux {
namespace {

using Block = std::function<void()>;

// Orders what a thread does before it hands a block over, and what the main loop does with it. GLib
// orders them as well, out of the thread sanitizer's sight.
constinit std::mutex handOver;

}  // namespace

GSource* attach(GSource* source, int priority, Block block) {
  std::unique_lock order(handOver);
  auto* const handed = new Block(std::move(block));
  order.unlock();
  g_source_set_priority(source, priority);
  g_source_set_callback(
      source,
      [](gpointer data) -> gboolean {
        std::unique_lock(handOver).unlock();
        (*static_cast<Block*>(data))();
        return G_SOURCE_REMOVE;
      },
      handed,
      [](gpointer data) {
        std::unique_lock(handOver).unlock();
        delete static_cast<Block*>(data);
      });
  g_source_attach(source, nullptr);
  return source;
}

void detach(GSource* source) {
  g_source_destroy(source);
  g_source_unref(source);
}

void runOnMainLoop(Block block) {
  g_source_unref(attach(g_idle_source_new(), G_PRIORITY_DEFAULT, std::move(block)));
}

}  // namespace Varnel::Platform::Linux
