// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

namespace Varnel::Platform {

class DeviceRegistry;
class DiskArbitration;
class ProcessInfo;
class VolumeCatalog;
class Workspace;

}  // namespace Varnel::Platform

/// Adapters for Linux, beyond those that it shares with the rest of the POSIX family.
namespace Varnel::Platform::Linux {

[[nodiscard]] std::unique_ptr<DeviceRegistry> makeDeviceRegistry();
[[nodiscard]] std::unique_ptr<DiskArbitration> makeDiskArbitration();
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo();
[[nodiscard]] std::unique_ptr<VolumeCatalog> makeVolumeCatalog();
[[nodiscard]] std::unique_ptr<Workspace> makeWorkspace();

}  // namespace Varnel::Platform::Linux
