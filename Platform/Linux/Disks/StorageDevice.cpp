// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/StorageDevice.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Linux/Disks/KernelFolder.h>

namespace Varnel::Platform::Linux {
namespace {

constexpr std::pair<std::string_view, Bus> subsystemBuses[] = {
    {"usb", Bus::usb},       {"firewire", Bus::firewire},   {"mmc", Bus::mmc},
    {"nvme", Bus::nvme},     {"nvme-subsystem", Bus::nvme}, {"scsi", Bus::scsi},
    {"virtio", Bus::virtio},
};

}  // namespace

Bus busOf(const std::vector<std::string>& subsystems) {
  if (subsystems.empty()) return Bus::none;
  const auto has = [&](std::string_view name) {
    return std::find(subsystems.begin(), subsystems.end(), name) != subsystems.end();
  };
  for (const auto& [subsystem, bus] : subsystemBuses)
    if (has(subsystem)) return bus;
  return Bus::other;
}

bool decidesBus(std::string_view subsystem) {
  // A SCSI device may still turn out to hang on USB; a device of another bus cannot.
  return !subsystem.empty() && subsystem != "scsi";
}

bool isSmartCapable(const StorageDevice& device) {
  if (device.isRemovable || device.isHidden) return false;
  return device.bus == Bus::nvme || device.bus == Bus::scsi || device.bus == Bus::virtio;
}

std::string_view mediumType(const StorageDevice& device) {
  return device.isSolidState ? "Solid State" : "Rotational";
}

std::string identifyingSerial(const StorageDevice& device) {
  for (const std::string& text : {trimmed(device.serialNumber), serialInPage(device.serialPage),
                                  trimmed(device.recordedSerial), trimmed(device.worldWideName)})
    if (!text.empty()) return text;
  return device.place;
}

std::string serialInPage(std::string_view page) {
  constexpr std::size_t header = 4;
  constexpr char pageCode = '\x80';
  if (page.size() < header || page[1] != pageCode) return {};
  const std::size_t length = static_cast<std::size_t>(static_cast<unsigned char>(page[2])) << 8 |
                             static_cast<unsigned char>(page[3]);
  return trimmed(page.substr(header, length));
}

std::optional<bool> isInternal(Bus bus, bool isRemovable, std::string_view cardType) {
  switch (bus) {
    case Bus::none:
    case Bus::other:
      return isRemovable ? std::optional(false) : std::nullopt;
    case Bus::usb:
    case Bus::firewire:
      return false;
    case Bus::mmc:
      return cardType != "SD";
    case Bus::nvme:
    case Bus::scsi:
    case Bus::virtio:
      return !isRemovable;
  }
  return std::nullopt;
}

}  // namespace Varnel::Platform::Linux
