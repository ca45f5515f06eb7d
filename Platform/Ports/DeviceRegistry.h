// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// An entry of the device registry: a device, a disk, a partition. It, and all that is reached from
/// it, shows the registry as it was at the look-up, also when a device has been unplugged since.
/// Owning it keeps the system's handle open; destruction releases it. One thread at a time.
class VARNEL_API RegistryEntry {
 public:
  virtual ~RegistryEntry() = default;

  /// The value of one of this entry's own properties.
  [[nodiscard]] virtual std::optional<PropertyValue> property(std::string_view name) const = 0;

  /// All properties; absent when they cannot be read.
  [[nodiscard]] virtual std::optional<PropertyDictionary> properties() const = 0;

  /// The entry above, the first of several; null when there is none or the look-up fails.
  [[nodiscard]] virtual std::unique_ptr<RegistryEntry> parent() const = 0;

  /// The entries below. An entry with several parents (a RAID) stands below each.
  [[nodiscard]] virtual std::vector<std::unique_ptr<RegistryEntry>> children() const = 0;
};

/// The system's tree of devices. Any thread. Reads kernel tables only, never a device.
///
/// Storage devices carry "SMART Capable" (a truth value) and, when it is true, "Device
/// Characteristics", a dictionary with the texts "Medium Type" ("Solid State" or "Rotational") and
/// "Serial Number". Disks and partitions below them carry "BSD Name", the name by which
/// `DiskArbitration` knows them.
class VARNEL_API DeviceRegistry {
 public:
  using Entries = std::vector<std::unique_ptr<RegistryEntry>>;

  virtual ~DeviceRegistry() = default;
  DeviceRegistry& operator=(const DeviceRegistry&) = delete;

  /// The entries whose own property `name` has this value, of the same type, in the registry's
  /// order. Absent when the registry cannot be read.
  [[nodiscard]] virtual std::optional<Entries> entriesMatchingProperty(
      std::string_view name, const PropertyValue& value) = 0;
};

}  // namespace Varnel::Platform
