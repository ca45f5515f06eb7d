// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/ApplicationActivity.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <gtk/gtk.h>

#include <vector>

namespace Varnel::GTK3 {

class ApplicationActivity::Watch final {
 public:
  explicit Watch(Platform::Application& application)
      : application_(application), widgetClass_(g_type_class_ref(GTK_TYPE_WIDGET)) {
    // Every window's focus, also that of dialogs that the host never sees.
    for (const char* name : {"focus-in-event", "focus-out-event"}) {
      const guint signal = g_signal_lookup(name, GTK_TYPE_WIDGET);
      hooks_.push_back(
          {signal, g_signal_add_emission_hook(signal, 0, &Watch::noteFocus, this, nullptr)});
    }
    look();
  }
  Watch(const Watch&) = delete;
  Watch& operator=(const Watch&) = delete;
  ~Watch() {
    for (const auto& [signal, hook] : hooks_) g_signal_remove_emission_hook(signal, hook);
    if (idle_ != 0) g_source_remove(idle_);
    g_type_class_unref(widgetClass_);
    application_.setActive(false);
  }

 private:
  // One window loses the focus before another gets it, so the answer is found when both have
  // happened.
  static gboolean noteFocus(GSignalInvocationHint*, guint, const GValue*, gpointer self) noexcept {
    auto& watch = *static_cast<Watch*>(self);
    if (watch.idle_ == 0) watch.idle_ = g_idle_add(&Watch::lookLater, self);
    return TRUE;
  }

  static gboolean lookLater(gpointer self) noexcept {
    auto& watch = *static_cast<Watch*>(self);
    watch.idle_ = 0;
    watch.look();
    return G_SOURCE_REMOVE;
  }

  void look() {
    GList* windows = gtk_window_list_toplevels();
    bool isActive = false;
    for (const GList* window = windows; window; window = window->next)
      isActive = isActive || gtk_window_is_active(GTK_WINDOW(window->data));
    g_list_free(windows);
    application_.setActive(isActive);
  }

  struct Hook {
    guint signal;
    gulong hook;
  };

  Platform::Application& application_;
  const gpointer widgetClass_;  // The signals are known while there is one.
  std::vector<Hook> hooks_;
  guint idle_ = 0;
};

ApplicationActivity::ApplicationActivity(Platform::Application& application)
    : watch_(std::make_unique<Watch>(application)) {}

ApplicationActivity::ApplicationActivity()
    : ApplicationActivity(Platform::processPorts().application) {}

ApplicationActivity::~ApplicationActivity() = default;

}  // namespace Varnel::GTK3
