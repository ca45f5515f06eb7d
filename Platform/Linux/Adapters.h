// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

namespace Varnel::Platform {

class DeviceRegistry;
class DiskArbitration;
class MainQueue;
class ProcessInfo;
class SoundPlayer;
class SystemLog;
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
[[nodiscard]] std::unique_ptr<MainQueue> makeMainQueue();
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo();
[[nodiscard]] std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog);
[[nodiscard]] std::unique_ptr<VolumeCatalog> makeVolumeCatalog(std::shared_ptr<MountTable> table);
[[nodiscard]] std::unique_ptr<Workspace> makeWorkspace();

}  // namespace Varnel::Platform::Linux
