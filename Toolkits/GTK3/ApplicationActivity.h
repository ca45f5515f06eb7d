// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {
class Application;
}

namespace Varnel::GTK3 {

/// Tells the framework whether the application is in front: while one of its windows, dialogs
/// included, has the keyboard. Banners of reminders are shown only while it is not.
///
///     auto application = Gtk::Application::create("com.example.Fotovia");
///     GTK3::ApplicationActivity activity;
///
/// A change from one window of the application to another is none. Made and destroyed on the main
/// thread, before or after GTK starts; without it, and when it goes, the application counts as not
/// in front.
class VARNEL_API ApplicationActivity final {
 public:
  /// The application outlives this.
  explicit ApplicationActivity(Platform::Application& application);
  /// Tells the process's application.
  ApplicationActivity();
  ~ApplicationActivity();
  ApplicationActivity(const ApplicationActivity&) = delete;
  ApplicationActivity& operator=(const ApplicationActivity&) = delete;

 private:
  class Watch;

  const std::unique_ptr<Watch> watch_;
};

}  // namespace Varnel::GTK3
