// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/OVDiskInfo.h>

#include <array>
#include <utility>

#include <Varnel/DiskAccess/DiskInventory.h>
#include <Varnel/DiskAccess/InventedIdentifiers.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/Ports.h>

namespace Varnel {
namespace {

constexpr std::array<std::int64_t, 5> maxThreadsByKind{1, 4, 2, 1, 1};

}  // namespace

OVDiskInfo::OVDiskInfo(std::optional<std::string> uniqueID, std::optional<VolumeURLs> volumeURLs,
                       OVDiskKind kind)
    : uniqueID_(std::move(uniqueID)), volumeURLs_(std::move(volumeURLs)), kind_(kind) {}

std::int64_t OVDiskInfo::maxTreads() const {
  const auto value = static_cast<std::int64_t>(kind_);
  const auto index = static_cast<std::uint64_t>(value);
  return index < maxThreadsByKind.size() ? maxThreadsByKind[index] : value;
}

bool OVDiskInfo::isEqual(const OVDiskInfo* other) const {
  return other ? uniqueID_ == other->uniqueID_ : !uniqueID_;
}

std::size_t OVDiskInfo::hash() const {
  return std::hash<std::optional<std::string>>{}(uniqueID_);
}

OVDiskInfo::Array OVDiskInfo::allDiskInfos() {
  return allDiskInfos(Platform::processPorts());
}

OVDiskInfo::Array OVDiskInfo::allDiskInfos(const Platform::Ports& ports) {
  return allDiskInfos({.devices = ports.deviceRegistry,
                       .disks = ports.diskArbitration,
                       .volumes = ports.volumeCatalog});
}

OVDiskInfo::Array OVDiskInfo::allDiskInfos(Ports ports) {
  InventedIdentifiers identifiers;
  return DiskInventory::take(ports, identifiers);
}

std::shared_ptr<const Platform::RegistryEntry> OVDiskInfo::serviceForDevice(
    std::shared_ptr<const Platform::RegistryEntry> entry) {
  return DiskInventory::serviceForDevice(std::move(entry));
}

std::optional<Platform::PropertyDictionary> OVDiskInfo::characteristicsForDevice(
    const Platform::RegistryEntry& entry) {
  return DiskInventory::characteristicsForDevice(entry);
}

std::set<std::string> OVDiskInfo::bsdNamesForDevice(const Platform::RegistryEntry& entry) {
  return DiskInventory::bsdNamesForDevice(entry);
}

std::optional<OVDiskInfo::VolumeURLs> OVDiskInfo::volumeURLsForDevice(
    const Platform::RegistryEntry& entry, Platform::DiskArbitration& disks) {
  return DiskInventory::volumeURLsForDevice(entry, disks);
}

}  // namespace Varnel
