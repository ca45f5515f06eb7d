// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class DeviceRegistry;
class DiskArbitration;
class RegistryEntry;
class VolumeCatalog;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

/// What kind of device a disk is. Hosts may use further values of their own.
enum class OVDiskKind : std::int64_t { unknown = 0, solidState, rotational, external, network };

inline constexpr OVDiskKind OVDiskKindUnknown = OVDiskKind::unknown;
inline constexpr OVDiskKind OVDiskKindSolidState = OVDiskKind::solidState;
inline constexpr OVDiskKind OVDiskKindRotational = OVDiskKind::rotational;
inline constexpr OVDiskKind OVDiskKindExternal = OVDiskKind::external;
inline constexpr OVDiskKind OVDiskKindNetwork = OVDiskKind::network;

/// One physical storage device, or one volume that could not be tied to a device.
///
///     for (const auto& disk : OVDiskInfo::allDiskInfos())
///       print(disk->uniqueID().value_or("?"), disk->maxTreads());
///
/// Immutable, and shared by pointer: a copy of the pointer is the copy of the disk. Any thread.
/// Nothing here fails: a fact that the system does not tell is absent.
class VARNEL_API OVDiskInfo final {
 public:
  /// The services that an inventory asks.
  struct Ports {
    Platform::DeviceRegistry& devices;
    Platform::DiskArbitration& disks;
    Platform::VolumeCatalog& volumes;
  };

  using Array = std::vector<std::shared_ptr<const OVDiskInfo>>;
  using VolumeURLs = std::set<Platform::URL>;

  OVDiskInfo(std::optional<std::string> uniqueID, std::optional<VolumeURLs> volumeURLs,
             OVDiskKind kind);
  OVDiskInfo(const OVDiskInfo&) = delete;
  OVDiskInfo& operator=(const OVDiskInfo&) = delete;

  /// A fresh inventory of the devices and the mounted volumes: the devices in the registry's order,
  /// then the volumes that lie on none of them in the system's order. A volume over two devices is
  /// in the set of each. Reads the kernel's tables, no disk.
  [[nodiscard]] static Array allDiskInfos();
  [[nodiscard]] static Array allDiskInfos(Ports ports);
  [[nodiscard]] static Array allDiskInfos(const Platform::Ports& ports);

  /// Identifies the device; equality and hash use it alone. A device that tells no serial number
  /// has a new one in each inventory; only a manager's inventories remember it while one of the
  /// device's volumes stays mounted.
  [[nodiscard]] const std::optional<std::string>& uniqueID() const { return uniqueID_; }

  /// The roots of the mounted volumes on this device; absent when they could not be told.
  [[nodiscard]] const std::optional<VolumeURLs>& volumeURLs() const { return volumeURLs_; }

  [[nodiscard]] OVDiskKind kind() const { return kind_; }

  /// How many threads may access the device at once. For a kind that has no limit of its own, the
  /// value of the kind. (The name is published so.)
  [[nodiscard]] std::int64_t maxTreads() const;

  /// Whether both have the same identifier, or neither has one. Null has none.
  [[nodiscard]] bool isEqual(const OVDiskInfo* other) const;
  bool operator==(const OVDiskInfo& other) const { return isEqual(&other); }
  [[nodiscard]] std::size_t hash() const;

  /// The nearest entry that carries "SMART Capable", from this entry up; null when there is none or
  /// a look-up fails.
  [[nodiscard]] static std::shared_ptr<const Platform::RegistryEntry> serviceForDevice(
      std::shared_ptr<const Platform::RegistryEntry> entry);

  /// The entry's "Device Characteristics" if it is capable of SMART.
  [[nodiscard]] static std::optional<Platform::PropertyDictionary> characteristicsForDevice(
      const Platform::RegistryEntry& entry);

  /// The device names of everything below the entry, its own left out.
  [[nodiscard]] static std::set<std::string> bsdNamesForDevice(
      const Platform::RegistryEntry& entry);

  /// Where everything below the entry is mounted; absent when nothing below has a device name or
  /// disk arbitration cannot be reached.
  [[nodiscard]] static std::optional<VolumeURLs> volumeURLsForDevice(
      const Platform::RegistryEntry& entry, Platform::DiskArbitration& disks);

 private:
  const std::optional<std::string> uniqueID_;
  const std::optional<VolumeURLs> volumeURLs_;
  const OVDiskKind kind_;
};

using DiskInfo = OVDiskInfo;
using DiskKind = OVDiskKind;

}  // namespace Varnel

template <>
struct std::hash<Varnel::OVDiskInfo> {
  std::size_t operator()(const Varnel::OVDiskInfo& disk) const { return disk.hash(); }
};
