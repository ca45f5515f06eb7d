// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/application.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/GTK3/ApplicationActivity.h>
#include <Varnel/GTK3/RouterAtStartup.h>
#include <Varnel/Interface/SoundEngine.h>
#include <orvane-window/Interface/MainWindow.h>
#include <orvane-window/Interface/TurnTimes.h>
#include <orvane-window/Model/Background.h>
#include <orvane-window/Model/Reminding.h>
#include <orvane-window/Model/SystemEngine.h>

namespace Orvane {

class Console;

/// The application on the desktop: one instance a session, which the bus may start. A second one
/// hands its folders to the first. Main thread.
class WindowApplication final : public Gtk::Application {
 public:
  /// The console outlives the application.
  static Glib::RefPtr<WindowApplication> create(Console& console);
  ~WindowApplication() override;

 protected:
  void on_startup() override;
  void on_activate() override;
  void on_open(const type_vec_files& files, const Glib::ustring& hint) override;

 private:
  explicit WindowApplication(Console& console);
  int takeOptions(const Glib::RefPtr<Glib::VariantDict>& options);
  void shutDown();
  void addActions();
  MainWindow& window();
  /// For what stands above it: the bus may ask for that before there is a window.
  MainWindow& shownWindow();
  /// Does so at once, or as soon as there is a window.
  void withWindow(std::function<void(MainWindow&)> act);
  void showPreferences();
  void showLicense();
  void openLink(const std::string& name);
  void debug(const std::string& name);
  [[nodiscard]] bool kept(const std::optional<Varnel::Platform::PlatformError>& failure);

  Console& console_;
  std::optional<std::string> analyticsEndpoint_;
  std::optional<TurnTimes> turnTimes_;
  Varnel::GTK3::ApplicationActivity activity_;
  std::unique_ptr<SystemEngine> engine_;
  std::unique_ptr<Reminding> reminding_;  ///< Of the first instance alone.
  std::unique_ptr<Varnel::SoundEngine> sounds_;
  std::unique_ptr<ThreadBackground> work_;
  std::unique_ptr<ThreadBackground> links_;
  std::unique_ptr<MainWindow> window_;
  std::optional<Varnel::GTK3::RouterAtStartup> routing_;
};

}  // namespace Orvane
