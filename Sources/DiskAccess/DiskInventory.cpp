// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskInventory.h>

#include <string_view>
#include <utility>

#include <Varnel/DiskAccess/InventedIdentifiers.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel::DiskInventory {
namespace {

using Platform::MountedVolume;
using Platform::PropertyDictionary;
using Platform::RegistryEntry;

constexpr std::string_view smartCapable = "SMART Capable";
constexpr std::string_view deviceCharacteristics = "Device Characteristics";
constexpr std::string_view mediumType = "Medium Type";
constexpr std::string_view serialNumber = "Serial Number";
constexpr std::string_view bsdName = "BSD Name";
constexpr std::string_view solidState = "Solid State";

void collectNames(const RegistryEntry& entry, std::set<std::string>& names) {
  for (const auto& child : entry.children()) {
    const auto name = child->property(bsdName);
    if (const auto* text = name ? name->as<std::string>() : nullptr) names.insert(*text);
    collectNames(*child, names);
  }
}

std::shared_ptr<const OVDiskInfo> diskOfService(const std::shared_ptr<const RegistryEntry>& service,
                                                Platform::DiskArbitration& disks,
                                                InventedIdentifiers& identifiers) {
  const auto device = serviceForDevice(service);
  if (!device) return nullptr;
  const PropertyDictionary characteristics =
      characteristicsForDevice(*service).value_or(PropertyDictionary());
  const auto* medium = findAs<std::string>(characteristics, mediumType);
  const auto* serial = findAs<std::string>(characteristics, serialNumber);
  auto volumes = volumeURLsForDevice(*device, disks);
  auto uniqueID =
      serial ? *serial : identifiers.identifierFor(volumes.value_or(OVDiskInfo::VolumeURLs()));
  return std::make_shared<OVDiskInfo>(
      std::move(uniqueID), std::move(volumes),
      medium && *medium == solidState ? OVDiskKindSolidState : OVDiskKindRotational);
}

OVDiskKind kindOf(const MountedVolume& volume) {
  if (volume.isLocal == false) return OVDiskKindNetwork;
  if (volume.isInternal == false) return OVDiskKindExternal;
  return OVDiskKindUnknown;
}

std::shared_ptr<const OVDiskInfo> diskOfVolume(const MountedVolume& volume,
                                               InventedIdentifiers& identifiers) {
  OVDiskInfo::VolumeURLs volumes{volume.url};
  auto uniqueID = volume.uuid ? *volume.uuid : identifiers.identifierFor(volumes);
  return std::make_shared<OVDiskInfo>(std::move(uniqueID), std::move(volumes), kindOf(volume));
}

}  // namespace

OVDiskInfo::Array take(OVDiskInfo::Ports ports, InventedIdentifiers& identifiers) {
  OVDiskInfo::Array result;
  OVDiskInfo::VolumeURLs claimed;
  if (auto services = ports.devices.entriesMatchingProperty(smartCapable, true)) {
    for (auto& service : *services) {
      auto disk = diskOfService(std::move(service), ports.disks, identifiers);
      if (!disk) continue;
      if (const auto& urls = disk->volumeURLs()) claimed.insert(urls->begin(), urls->end());
      result.push_back(std::move(disk));
    }
  }
  for (const MountedVolume& volume : ports.volumes.mountedVolumes())
    if (!claimed.contains(volume.url)) result.push_back(diskOfVolume(volume, identifiers));
  identifiers.endInventory();
  return result;
}

std::shared_ptr<const RegistryEntry> serviceForDevice(std::shared_ptr<const RegistryEntry> entry) {
  while (entry && !entry->property(smartCapable)) entry = entry->parent();
  return entry;
}

std::optional<PropertyDictionary> characteristicsForDevice(const RegistryEntry& entry) {
  const auto properties = entry.properties();
  if (!properties) return std::nullopt;
  const bool* capable = findAs<bool>(*properties, smartCapable);
  if (!capable || !*capable) return std::nullopt;
  const auto* characteristics = findAs<PropertyDictionary>(*properties, deviceCharacteristics);
  return characteristics ? std::optional(*characteristics) : std::nullopt;
}

std::set<std::string> bsdNamesForDevice(const RegistryEntry& entry) {
  std::set<std::string> names;
  collectNames(entry, names);
  return names;
}

std::optional<OVDiskInfo::VolumeURLs> volumeURLsForDevice(const RegistryEntry& entry,
                                                          Platform::DiskArbitration& disks) {
  const std::set<std::string> names = bsdNamesForDevice(entry);
  if (names.empty()) return std::nullopt;
  const auto session = disks.openSession();
  if (!session) return std::nullopt;
  OVDiskInfo::VolumeURLs result;
  for (const std::string& name : names)
    for (auto& url : session->mountURLs(name)) result.insert(std::move(url));
  return result;
}

}  // namespace Varnel::DiskInventory
