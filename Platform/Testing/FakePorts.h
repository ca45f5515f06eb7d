// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <string>
#include <system_error>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeAppendFiles.h>
#include <Varnel/Platform/Testing/FakeApplication.h>
#include <Varnel/Platform/Testing/FakeApplicationStorage.h>
#include <Varnel/Platform/Testing/FakeCookieStorage.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>
#include <Varnel/Platform/Testing/FakeMachineIdentity.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeProcessLauncher.h>
#include <Varnel/Platform/Testing/FakeReadingPriority.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeSessionBoard.h>
#include <Varnel/Platform/Testing/FakeSoundPlayer.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Testing/FakeTrash.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeUserNotificationCenter.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Platform/Values/UUID.h>

namespace Varnel::Platform::Testing {

/// A fake of every port, and the set of them that the framework's classes are made with.
///
///     FakePorts fakes;
///     fakes.volumeCatalog.mount({.url = URL::fileURLWithPath("/"), .isLocal = true});
///     DiskAccessManager manager(fakes.ports());
///     fakes.clock.advance(1h);
///
/// Private files are real ones, because a database opens them by their path; they lie in a folder
/// that goes with the fakes. The fakes outlive what is made with them; a test that installs them as
/// the process's (`installProcessPorts`) never destroys them.
struct FakePorts {
  FakePorts() = default;
  FakePorts(const FakePorts&) = delete;
  FakePorts& operator=(const FakePorts&) = delete;
  ~FakePorts() {
    std::error_code ignored;
    std::filesystem::remove_all(folder, ignored);
  }

  /// Where the application's files go; nobody has made it yet.
  const std::string folder =
      (std::filesystem::temp_directory_path() / ("fakes-" + randomUUIDString())).string();

  FakeAppendFiles appendFiles;
  FakeApplication application;
  FakeApplicationStorage applicationStorage{folder};
  SimulatedClock clock;
  FakeCookieStorage cookieStorage;
  FakeDeviceRegistry deviceRegistry;
  FakeDiskArbitration diskArbitration;
  FakeExtendedAttributes extendedAttributes;
  FakeHTTPClient httpClient;
  FakeMachineIdentity machineIdentity;
  FakeMainQueue mainQueue;
  FaultyPrivateFiles privateFiles{systemPorts().privateFiles};
  FakeProcessInfo processInfo;
  FakeProcessLauncher processLauncher;
  FakeReadingPriority readingPriority;
  FakeSecurityScope securityScope;
  FakeSessionBoard sessionBoard;
  FakeSoundPlayer soundPlayer;
  CapturedOutput standardOutput;
  CapturedSystemLog systemLog;
  FakeTimeZones timeZones;
  FakeTrash trash;
  FakeUserAccount userAccount;
  FakeUserLocale userLocale;
  FakeUserNotificationCenters userNotificationCenters;
  FakeVolumeCatalog volumeCatalog;
  FakeWorkspace workspace;

  [[nodiscard]] Ports ports() {
    return {
        .appendFiles = appendFiles,
        .application = application,
        .applicationStorage = applicationStorage,
        .clock = clock,
        .cookieStorage = cookieStorage,
        .deviceRegistry = deviceRegistry,
        .diskArbitration = diskArbitration,
        .extendedAttributes = extendedAttributes,
        .httpClient = httpClient,
        .machineIdentity = machineIdentity,
        .mainQueue = mainQueue,
        .privateFiles = privateFiles,
        .processInfo = processInfo,
        .processLauncher = processLauncher,
        .readingPriority = readingPriority,
        .securityScope = securityScope,
        .sessionBoard = sessionBoard,
        .soundPlayer = soundPlayer,
        .standardOutput = standardOutput,
        .systemLog = systemLog,
        .timeZones = timeZones,
        .trash = trash,
        .userAccount = userAccount,
        .userLocale = userLocale,
        .userNotificationCenters = userNotificationCenters,
        .volumeCatalog = volumeCatalog,
        .workspace = workspace,
    };
  }
};

}  // namespace Varnel::Platform::Testing
