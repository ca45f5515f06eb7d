// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

class AppendFiles;
class Application;
class ApplicationStorage;
class Clock;
class CookieStorage;
class DeviceRegistry;
class DiskArbitration;
class ExtendedAttributes;
class HTTPClient;
class MachineIdentity;
class MainQueue;
class PrivateFiles;
class ProcessInfo;
class ProcessLauncher;
class ReadingPriority;
class SecurityScope;
class SessionBoard;
class SoundPlayer;
class StandardOutput;
class SystemLog;
class TimeZones;
class Trash;
class UserAccount;
class UserLocale;
class UserNotificationCenters;
class VolumeCatalog;
class Workspace;

/// One service of each kind. Assigning to a member puts another service in the place of that one;
/// the others stay, and go on to use the services that they were made with. The objects behind the
/// references outlive all their users; those of the process are never destroyed.
///
///     static auto& clock = *new MyClock();  // a host's own service among the system's
///     Ports ports = systemPorts();
///     ports.clock = clock;
///     if (!installProcessPorts(ports)) return 1;
///     …
///     processPorts().clock.get().now()
struct Ports {
  std::reference_wrapper<AppendFiles> appendFiles;
  std::reference_wrapper<Application> application;
  std::reference_wrapper<ApplicationStorage> applicationStorage;
  std::reference_wrapper<Clock> clock;
  std::reference_wrapper<CookieStorage> cookieStorage;
  std::reference_wrapper<DeviceRegistry> deviceRegistry;
  std::reference_wrapper<DiskArbitration> diskArbitration;
  std::reference_wrapper<ExtendedAttributes> extendedAttributes;
  std::reference_wrapper<HTTPClient> httpClient;
  std::reference_wrapper<MachineIdentity> machineIdentity;
  std::reference_wrapper<MainQueue> mainQueue;
  std::reference_wrapper<PrivateFiles> privateFiles;
  std::reference_wrapper<ProcessInfo> processInfo;
  std::reference_wrapper<ProcessLauncher> processLauncher;
  std::reference_wrapper<ReadingPriority> readingPriority;
  std::reference_wrapper<SecurityScope> securityScope;
  std::reference_wrapper<SessionBoard> sessionBoard;
  std::reference_wrapper<SoundPlayer> soundPlayer;
  std::reference_wrapper<StandardOutput> standardOutput;
  std::reference_wrapper<SystemLog> systemLog;
  std::reference_wrapper<TimeZones> timeZones;
  std::reference_wrapper<Trash> trash;
  std::reference_wrapper<UserAccount> userAccount;
  std::reference_wrapper<UserLocale> userLocale;
  std::reference_wrapper<UserNotificationCenters> userNotificationCenters;
  std::reference_wrapper<VolumeCatalog> volumeCatalog;
  std::reference_wrapper<Workspace> workspace;
};

/// The process's own services: those of the system, unless the host installed others before the
/// first use. Any thread; made on first use and never destroyed.
[[nodiscard]] VARNEL_API const Ports& processPorts();

/// Makes a copy of `ports` the process's services. It must be called before anything of the
/// framework is used and at most once; returns false, and changes nothing, when it comes too late.
/// Any thread.
[[nodiscard]] VARNEL_API bool installProcessPorts(const Ports& ports);

/// The services of the system that the library was built for. A port to another system supplies
/// this function together with its adapters. Made on first use and never destroyed.
[[nodiscard]] VARNEL_API const Ports& systemPorts();

}  // namespace Varnel::Platform
