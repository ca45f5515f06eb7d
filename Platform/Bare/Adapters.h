// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

namespace Varnel::Platform {

class ApplicationStorage;
class DeviceRegistry;
class DiskArbitration;
class ExtendedAttributes;
class MachineIdentity;
class MainQueue;
class PrivateFiles;
class ProcessInfo;
class ProcessLauncher;
class ReadingPriority;
class SessionBoard;
class SoundPlayer;
class StandardOutput;
class SystemLog;
class TimeZones;
class Trash;
class UserNotificationCenters;
class VolumeCatalog;
class Workspace;

}  // namespace Varnel::Platform

/// Adapters for a bare system: POSIX and the libraries of the framework, without a desktop and
/// without any list of devices, mounts or applications. A port to another system of the POSIX
/// family begins here and replaces one adapter after another.
namespace Varnel::Platform::Bare {

[[nodiscard]] std::unique_ptr<ApplicationStorage> makeApplicationStorage(PrivateFiles& files,
                                                                         SystemLog& systemLog);
/// The thread that loaded the library counts as the main thread.
[[nodiscard]] std::unique_ptr<MainQueue> makeMainQueue();
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo();
[[nodiscard]] std::unique_ptr<StandardOutput> makeStandardOutput();
/// The rules are ICU's own.
[[nodiscard]] std::unique_ptr<TimeZones> makeTimeZones();
/// One volume, the root, on which everything lies.
[[nodiscard]] std::unique_ptr<VolumeCatalog> makeVolumeCatalog();

// Services that such a system lacks. What is asked of them fails or is absent, as their ports have
// it.
[[nodiscard]] std::unique_ptr<DeviceRegistry> noDeviceRegistry();
[[nodiscard]] std::unique_ptr<DiskArbitration> noDiskArbitration();
[[nodiscard]] std::unique_ptr<ExtendedAttributes> noExtendedAttributes();
[[nodiscard]] std::unique_ptr<MachineIdentity> noMachineIdentity();
[[nodiscard]] std::unique_ptr<ProcessLauncher> noProcessLauncher();
[[nodiscard]] std::unique_ptr<ReadingPriority> noReadingPriority();
[[nodiscard]] std::unique_ptr<SessionBoard> noSessionBoard();
[[nodiscard]] std::unique_ptr<SoundPlayer> noSoundPlayer();
[[nodiscard]] std::unique_ptr<Trash> noTrash();
[[nodiscard]] std::unique_ptr<UserNotificationCenters> noUserNotificationCenters(MainQueue& queue);
[[nodiscard]] std::unique_ptr<Workspace> noWorkspace();

}  // namespace Varnel::Platform::Bare
