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

#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Generic/WatchedMainQueue.h>
#include <Varnel/Platform/Linux/Adapters.h>
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
  // The adapters share it, and they are never destroyed.
  static const auto mountTable = Linux::makeMountTable();
  static Clock& clock = keep(POSIX::makeClock());
  static ProcessInfo& processInfo = keep(Linux::makeProcessInfo());
  static SystemLog& systemLog = keep(POSIX::makeSystemLog());
  static MainQueue& mainQueue = *new WatchedMainQueue(Linux::makeMainQueue(), systemLog);
  static PrivateFiles& privateFiles = keep(POSIX::makePrivateFiles());
  static TimeZones& timeZones = keep(Linux::makeTimeZones());
  static HostedApplication& application = *new HostedApplication;
  static UserLocale& userLocale = keep(POSIX::makeUserLocale());
  static const Ports& ports = *new Ports{
      .appendFiles = keep(POSIX::makeAppendFiles()),
      .application = application,
      .applicationStorage = keep(Linux::makeApplicationStorage(privateFiles, systemLog)),
      .clock = clock,
      .cookieStorage = keep(POSIX::makeCookieStorage(processInfo, clock)),
      .deviceRegistry = keep(Linux::makeDeviceRegistry()),
      .diskArbitration = keep(Linux::makeDiskArbitration(mountTable)),
      .extendedAttributes = keep(Linux::makeExtendedAttributes()),
      .httpClient = keep(POSIX::makeHTTPClient()),
      .machineIdentity = keep(Linux::makeMachineIdentity()),
      .mainQueue = mainQueue,
      .privateFiles = privateFiles,
      .processInfo = processInfo,
      .processLauncher = keep(Linux::makeProcessLauncher()),
      .readingPriority = keep(Linux::makeReadingPriority()),
      .securityScope = keep(POSIX::makeSecurityScope()),
      .sessionBoard = keep(POSIX::makeSessionBoard(privateFiles)),
      .soundPlayer = keep(Linux::makeSoundPlayer(systemLog, mainQueue)),
      .standardOutput = keep(Linux::makeStandardOutput()),
      .systemLog = systemLog,
      .timeZones = timeZones,
      .trash = keep(Linux::makeTrash(privateFiles, clock, timeZones)),
      .userAccount = keep(POSIX::makeUserAccount()),
      .userLocale = userLocale,
      .userNotificationCenters = keep(Linux::makeUserNotificationCenters(
          {clock, userLocale, timeZones, mainQueue, privateFiles, systemLog}, application)),
      .volumeCatalog = keep(Linux::makeVolumeCatalog(mountTable)),
      .workspace = keep(Linux::makeWorkspace()),
  };
  return ports;
}

}  // namespace Varnel::Platform
