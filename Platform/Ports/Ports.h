// SPDX-License-Identifier: MIT
#pragma once

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
class SoundPlayer;
class StandardOutput;
class SystemLog;
class TimeZones;
class UserAccount;
class UserLocale;
class UserNotificationCenters;
class VolumeCatalog;
class Workspace;

/// One service of each kind. The objects behind the references outlive all their users; those of
/// the process are never destroyed.
///
///     static auto& clock = *new MyClock();  // a host's own service among the system's
///     const Ports& system = systemPorts();
///     if (!installProcessPorts({.appendFiles = system.appendFiles, .clock = clock, …})) return 1;
struct Ports {
  AppendFiles& appendFiles;
  Application& application;
  ApplicationStorage& applicationStorage;
  Clock& clock;
  CookieStorage& cookieStorage;
  DeviceRegistry& deviceRegistry;
  DiskArbitration& diskArbitration;
  ExtendedAttributes& extendedAttributes;
  HTTPClient& httpClient;
  MachineIdentity& machineIdentity;
  MainQueue& mainQueue;
  PrivateFiles& privateFiles;
  ProcessInfo& processInfo;
  ProcessLauncher& processLauncher;
  ReadingPriority& readingPriority;
  SecurityScope& securityScope;
  SoundPlayer& soundPlayer;
  StandardOutput& standardOutput;
  SystemLog& systemLog;
  TimeZones& timeZones;
  UserAccount& userAccount;
  UserLocale& userLocale;
  UserNotificationCenters& userNotificationCenters;
  VolumeCatalog& volumeCatalog;
  Workspace& workspace;

  /// The same services with another standard output.
  [[nodiscard]] VARNEL_API Ports withStandardOutput(StandardOutput& output) const;
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
