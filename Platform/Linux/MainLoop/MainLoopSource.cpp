// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/MainLoop/MainLoopSource.h>

#include <glib-unix.h>

#include <utility>

namespace Varnel::Platform::Linux {
namespace {

using Callback = std::function<void()>;

gboolean dispatch(gint, GIOCondition, gpointer callback) noexcept {
  // A copy, because the callback may end its source.
  const Callback readable = *static_cast<Callback*>(callback);
  readable();
  return G_SOURCE_CONTINUE;
}

void release(gpointer callback) noexcept {
  delete static_cast<Callback*>(callback);
}

}  // namespace

MainLoopSource::MainLoopSource(int descriptor, std::function<void()> readable) {
  if (descriptor < 0) return;
  GSource* source = g_unix_fd_source_new(descriptor, G_IO_IN);
  // glib keeps such callbacks under a type of their own.
  g_source_set_callback(source, G_SOURCE_FUNC(&dispatch), new Callback(std::move(readable)),
                        &release);
  g_source_attach(source, nullptr);
  source_ = UniqueHandle<GSource*, destroy>(source);
}

void MainLoopSource::destroy(GSource* source) {
  g_source_destroy(source);
  g_source_unref(source);
}

}  // namespace Varnel::Platform::Linux
