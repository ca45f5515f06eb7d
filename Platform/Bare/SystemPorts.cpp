// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/CookieStorage.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Platform/Ports/MachineIdentity.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>
#include <Varnel/Platform/Ports/SecurityScope.h>
#include <Varnel/Platform/Ports/SessionBoard.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Ports/Workspace.h>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Generic/WatchedMainQueue.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform {
namespace {

// The process keeps its services for ever: threads that outlive main may still log.
template <typename Port>
Port& keep(std::unique_ptr<Port> adapter) {
  return *adapter.release();
}

}  // namespace

const Ports& systemPorts() {
  static Clock& clock = keep(POSIX::makeClock());
  static ProcessInfo& processInfo = keep(Bare::makeProcessInfo());
  static SystemLog& systemLog = keep(POSIX::makeSystemLog());
  static MainQueue& mainQueue = *new WatchedMainQueue(Bare::makeMainQueue(), systemLog);
  static PrivateFiles& privateFiles = keep(POSIX::makePrivateFiles());
  static const Ports& ports = *new Ports{
      .appendFiles = keep(POSIX::makeAppendFiles()),
      .application = *new HostedApplication,
      .applicationStorage = keep(Bare::makeApplicationStorage(privateFiles, systemLog)),
      .clock = clock,
      .cookieStorage = keep(POSIX::makeCookieStorage(processInfo, clock)),
      .deviceRegistry = keep(Bare::noDeviceRegistry()),
      .diskArbitration = keep(Bare::noDiskArbitration()),
      .extendedAttributes = keep(Bare::noExtendedAttributes()),
      .httpClient = keep(POSIX::makeHTTPClient()),
      .machineIdentity = keep(Bare::noMachineIdentity()),
      .mainQueue = mainQueue,
      .privateFiles = privateFiles,
      .processInfo = processInfo,
      .processLauncher = keep(Bare::noProcessLauncher()),
      .readingPriority = keep(Bare::noReadingPriority()),
      .securityScope = keep(POSIX::makeSecurityScope()),
      .sessionBoard = keep(Bare::noSessionBoard()),
      .soundPlayer = keep(Bare::noSoundPlayer()),
      .standardOutput = keep(Bare::makeStandardOutput()),
      .systemLog = systemLog,
      .timeZones = keep(Bare::makeTimeZones()),
      .trash = keep(Bare::noTrash()),
      .userAccount = keep(POSIX::makeUserAccount()),
      .userLocale = keep(POSIX::makeUserLocale()),
      .userNotificationCenters = keep(Bare::noUserNotificationCenters(mainQueue)),
      .volumeCatalog = keep(Bare::makeVolumeCatalog()),
      .workspace = keep(Bare::noWorkspace()),
  };
  return ports;
}

}  // namespace Varnel::Platform
