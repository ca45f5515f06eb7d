// SPDX-License-Identifier: MIT
#include <Platform/Ports/AppendFiles.h>
#include <Platform/Ports/Application.h>
#include <Platform/Ports/Clock.h>
#include <Platform/Ports/CookieStorage.h>
#include <Platform/Ports/DeviceRegistry.h>
#include <Platform/Ports/DiskArbitration.h>
#include <Platform/Ports/ExtendedAttributes.h>
#include <Platform/Ports/HTTPClient.h>
#include <Platform/Ports/MachineIdentity.h>
#include <Platform/Ports/MainQueue.h>
#include <Platform/Ports/Ports.h>
#include <Platform/Ports/ProcessInfo.h>
#include <Platform/Ports/ProcessLauncher.h>
#include <Platform/Ports/SecurityScope.h>
#include <Platform/Ports/SoundPlayer.h>
#include <Platform/Ports/StandardOutput.h>
#include <Platform/Ports/SystemLog.h>
#include <Platform/Ports/TimeZones.h>
#include <Platform/Ports/UserAccount.h>
#include <Platform/Ports/UserDefaults.h>
#include <Platform/Ports/UserLocale.h>
#include <Platform/Ports/UserNotificationCenter.h>
#include <Platform/Ports/VolumeCatalog.h>
#include <Platform/Ports/Workspace.h>

#include <Platform/Generic/HostedApplication.h>
#include <Platform/Generic/SQLiteCookieStorage.h>
#include <Platform/Generic/WatchedMainQueue.h>
#include <Platform/Linux/Adapters.h>
#include <Platform/Linux/UserFolders.h>
#include <Platform/POSIX/Adapters.h>

namespace Varnel::Platform {
namespace {

// The process keeps its services for ever: threads that outlive main may still log.
template <typename Port>
Port& keep(std::unique_ptr<Port> adapter) {
  return *adapter.release();
}

std::unique_ptr<CookieStorage> makeCookieStorage(const Clock& clock) {
  return std::make_unique<SQLiteCookieStorage>(Linux::userDataFolder(),
                                               Linux::applicationFolderName(), clock);
}

}  // namespace

const Ports& systemPorts() {
  // The adapters own it together, and they are kept.
  static const auto mountTable = Linux::makeMountTable();
  static Clock& clock = keep(POSIX::makeClock());
  static SystemLog& systemLog = keep(POSIX::makeSystemLog());
  static MainQueue& mainQueue = *new WatchedMainQueue(Linux::makeMainQueue(), systemLog);
  static TimeZones& timeZones = keep(Linux::makeTimeZones());
  static UserLocale& userLocale = keep(POSIX::makeUserLocale());
  static const Ports& ports = *new Ports{
      .appendFiles = keep(POSIX::makeAppendFiles()),
      .application = *new HostedApplication,
      .clock = clock,
      .cookieStorage = keep(makeCookieStorage(clock)),
      .deviceRegistry = keep(Linux::makeDeviceRegistry()),
      .diskArbitration = keep(Linux::makeDiskArbitration(mountTable)),
      .extendedAttributes = keep(Linux::makeExtendedAttributes()),
      .httpClient = keep(POSIX::makeHTTPClient()),
      .machineIdentity = keep(Linux::makeMachineIdentity()),
      .mainQueue = mainQueue,
      .processInfo = keep(Linux::makeProcessInfo()),
      .processLauncher = keep(Linux::makeProcessLauncher()),
      .securityScope = keep(POSIX::makeSecurityScope()),
      .soundPlayer = keep(Linux::makeSoundPlayer(systemLog, mainQueue)),
      .standardOutput = keep(Linux::makeStandardOutput()),
      .systemLog = systemLog,
      .timeZones = timeZones,
      .userAccount = keep(POSIX::makeUserAccount()),
      .userDefaults = keep(Linux::makeUserDefaults()),
      .userLocale = userLocale,
      .userNotificationCenters = keep(
          Linux::makeUserNotificationCenters({clock, userLocale, timeZones, mainQueue, systemLog})),
      .volumeCatalog = keep(Linux::makeVolumeCatalog(mountTable)),
      .workspace = keep(Linux::makeWorkspace()),
  };
  return ports;
}

}  // namespace Varnel::Platform
