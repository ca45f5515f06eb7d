// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <set>
#include <string>

#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {
class InventedIdentifiers;
}

/// How the devices of the registry and the mounted volumes become disks. `OVDiskInfo` is the public
/// face of these functions and describes them. No state; any thread.
namespace Varnel::DiskInventory {

/// A disk that tells no identifier gets one from `identifiers`.
[[nodiscard]] OVDiskInfo::Array take(OVDiskInfo::Ports ports, InventedIdentifiers& identifiers);

[[nodiscard]] std::shared_ptr<const Platform::RegistryEntry> serviceForDevice(
    std::shared_ptr<const Platform::RegistryEntry> entry);

[[nodiscard]] std::optional<Platform::PropertyDictionary> characteristicsForDevice(
    const Platform::RegistryEntry& entry);

[[nodiscard]] std::set<std::string> bsdNamesForDevice(const Platform::RegistryEntry& entry);

[[nodiscard]] std::optional<OVDiskInfo::VolumeURLs> volumeURLsForDevice(
    const Platform::RegistryEntry& entry, Platform::DiskArbitration& disks);

}  // namespace Varnel::DiskInventory
