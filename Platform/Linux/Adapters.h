// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

namespace Varnel::Platform {

class DeviceRegistry;
class DiskArbitration;
class ExtendedAttributes;
class MachineIdentity;
class MainQueue;
class ProcessInfo;
class ProcessLauncher;
class SoundPlayer;
class SystemLog;
class UserDefaults;
class VolumeCatalog;
class Workspace;

}  // namespace Varnel::Platform

/// Adapters for Linux, beyond those that it shares with the rest of the POSIX family.
namespace Varnel::Platform::Linux {

class MountTable;

/// The one view of the mount table that the volume catalogue and disk arbitration share.
[[nodiscard]] std::shared_ptr<MountTable> makeMountTable();

[[nodiscard]] std::unique_ptr<DeviceRegistry> makeDeviceRegistry();
[[nodiscard]] std::unique_ptr<DiskArbitration> makeDiskArbitration(
    std::shared_ptr<MountTable> table);
[[nodiscard]] std::unique_ptr<ExtendedAttributes> makeExtendedAttributes();
/// `root` is the folder below which /etc, /proc and /sys lie.
[[nodiscard]] std::unique_ptr<MachineIdentity> makeMachineIdentity(const std::string& root = "/");
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo();
[[nodiscard]] std::unique_ptr<ProcessLauncher> makeProcessLauncher();
[[nodiscard]] std::unique_ptr<UserDefaults> makeUserDefaults();
[[nodiscard]] std::unique_ptr<MainQueue> makeMainQueue();
[[nodiscard]] std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog);
[[nodiscard]] std::unique_ptr<VolumeCatalog> makeVolumeCatalog(std::shared_ptr<MountTable> table);
[[nodiscard]] std::unique_ptr<Workspace> makeWorkspace();

}  // namespace Varnel::Platform::Linux
