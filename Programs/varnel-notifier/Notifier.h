// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <string>

#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Generic/SharedWallClockTimer.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/FileWatch.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <varnel-notifier/ProgramFile.h>

namespace Varnel::Platform {
class ApplicationLauncher;
class WallClockTimer;
}  // namespace Varnel::Platform

namespace Varnel {

/// Delivers the scheduled notifications of all products of this user, whether the applications run
/// or not, and starts an application whose notification was clicked.
///
///     return Notifier(ports, executable).run();
///
/// One of the session does so: the owner of the notifier's name on the session bus. Main thread
/// only.
class Notifier final {
 public:
  /// What the ports refer to outlives it. `executable` is the path of this program.
  Notifier(const Platform::Linux::NotificationPorts& ports,
           const std::filesystem::path& executable);
  ~Notifier();
  Notifier(const Notifier&) = delete;
  Notifier& operator=(const Notifier&) = delete;

  /// Delivers until nothing is left to be delivered, shown or clicked, the program's file has gone,
  /// or the bus has. A program that was replaced takes over while no banner is up, as soon as
  /// it starts, and one that came elsewhere when this one has gone. Returns at once where another
  /// notifier runs. False where there is no bus.
  [[nodiscard]] bool run();

 private:
  class Product;

  /// The product with this store, if there is one.
  Product* product(const std::filesystem::path& path);
  void findProducts();
  void lookAtFolder(const std::string& name);
  void recheck();
  [[nodiscard]] bool isIdle() const;
  [[nodiscard]] bool isOver();
  [[nodiscard]] bool isReplaced();
  [[nodiscard]] bool handsOver();
  void receive(GVariant* arguments, GDBusMethodInvocation* call);
  [[nodiscard]] bool ownsName(const char* method);
  void sleepWhile(const std::function<bool()>& condition);

  const Platform::Linux::NotificationPorts ports_;
  const std::shared_ptr<Platform::Linux::SessionBus> bus_;
  const std::unique_ptr<Platform::ApplicationLauncher> launcher_;
  const std::unique_ptr<Platform::WallClockTimer> timer_;
  Platform::SharedWallClockTimer sharedTimer_;
  std::map<std::filesystem::path, std::unique_ptr<Product>> products_;  ///< By store.
  bool isDisconnected_ = false;
  const Platform::Linux::FileWatch zoneWatch_;
  const Platform::Linux::FileWatch stateWatch_;  ///< The folder of the products' folders.
  /// Those that came while this runs, in which there may yet be a store.
  std::map<std::filesystem::path, Platform::Linux::FileWatch> newFolders_;
  ProgramFile program_;
};

}  // namespace Varnel
