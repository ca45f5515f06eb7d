// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/BlockDevices.h>

#include <Varnel/Platform/Linux/Disks/UdevDatabase.h>
#include <Varnel/Platform/Linux/Disks/VirtioSerials.h>

namespace Varnel::Platform::Linux {
namespace {

// More layers than any machine has. A table that runs in circles ends here.
constexpr int maxLayers = 16;

// The device that carries a disk: "…/virtio1" of "…/virtio1/block/vda", "…/nvme0" of
// "…/nvme0/nvme0n1".
std::string_view carrierOf(std::string_view diskPlace) {
  const std::string_view above = folderOf(diskPlace);
  return lastComponent(above) == "block" ? folderOf(above) : above;
}

// The part of a place that is the same from every starting folder.
std::string_view withoutClimbing(std::string_view place) {
  while (place.starts_with("../")) place.remove_prefix(3);
  return place;
}

}  // namespace

std::string_view lastComponent(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

std::string_view folderOf(std::string_view path) {
  const std::size_t slash = path.rfind('/');
  return slash == std::string_view::npos ? std::string_view() : path.substr(0, slash);
}

bool isVirtual(std::string_view place) {
  return place.find("/virtual/block/") != std::string_view::npos;
}

std::string BlockDevices::place(const std::string& name) const {
  return devices_->link(name).value_or(std::string());
}

std::vector<std::string> BlockDevices::lowerDevices(const std::string& name) const {
  // The kinds that are numerous and rest on no other device.
  for (const std::string_view alone : {"loop", "ram", "zram"})
    if (name.starts_with(alone)) return {};
  return devices_->names(name + "/slaves");
}

bool BlockDevices::flag(const std::string& path) const {
  return text(path) == "1";
}

std::string BlockDevices::text(const std::string& path) const {
  return trimmed(devices_->bytes(path).value_or(std::string()));
}

Bus BlockDevices::bus(std::string_view place) const {
  if (isVirtual(place)) return Bus::none;
  std::vector<std::string> subsystems;
  for (std::string_view device = carrierOf(place);
       !device.empty() && lastComponent(device) != "devices"; device = folderOf(device)) {
    const auto link = devices_->link(std::string(device) + "/subsystem");
    if (!link) continue;
    subsystems.emplace_back(lastComponent(*link));
    if (decidesBus(subsystems.back())) break;
  }
  return busOf(subsystems);
}

StorageDevice BlockDevices::storageDevice(const std::string& name, std::string_view place,
                                          VirtioSerials& virtioSerials) const {
  StorageDevice device;
  device.bus = bus(place);
  device.isRemovable = flag(name + "/removable");
  // An NVMe disk with several paths is listed once for each path as well.
  if (device.bus == Bus::nvme) device.isHidden = flag(name + "/hidden");
  if (!isSmartCapable(device)) return device;

  device.isSolidState = text(name + "/queue/rotational") == "0";
  device.place = withoutClimbing(carrierOf(place));
  if (device.bus == Bus::scsi)
    device.serialPage = devices_->bytes(name + "/device/vpd_pg80").value_or(std::string());
  else if (device.bus == Bus::nvme)
    device.serialNumber = text(name + "/device/serial");
  else if (auto recorded = udevProperty(name, "ID_SERIAL"))
    device.serialNumber = *std::move(recorded);
  else
    device.serialNumber = virtioSerial(name, place, virtioSerials);
  if (!device.serialNumber.empty() || !serialInPage(device.serialPage).empty()) return device;

  device.recordedSerial = udevProperty(name, "ID_SERIAL_SHORT").value_or(std::string());
  device.worldWideName = text(name + (device.bus == Bus::nvme ? "/wwid" : "/device/wwid"));
  return device;
}

std::string BlockDevices::virtioSerial(const std::string& name, std::string_view place,
                                       VirtioSerials& virtioSerials) const {
  // No other disk gets this number until the next start of the system. Older kernels have no such
  // number.
  const std::string sequence = text(name + "/diskseq");
  return virtioSerials.of(sequence.empty() ? std::string(place) : sequence,
                          [devices = devices_, path = name + "/serial"] {
                            return trimmed(devices->bytes(path).value_or(std::string()));
                          });
}

std::optional<bool> BlockDevices::areInternal(const std::vector<std::string>& names) const {
  return areInternal(names, maxLayers);
}

std::optional<bool> BlockDevices::areInternal(const std::vector<std::string>& names,
                                              int depth) const {
  std::optional<bool> answer;
  for (const std::string& name : names) {
    answer = isInternal(name, depth);
    if (answer != true) break;
  }
  return answer;
}

std::optional<bool> BlockDevices::isInternal(const std::string& name, int depth) const {
  const std::string own = place(name);
  if (own.empty() || depth == 0) return std::nullopt;
  if (name.starts_with("loop")) return false;
  if (isVirtual(own)) return areInternal(lowerDevices(name), depth - 1);
  if (devices_->contains(name + "/partition"))
    return isInternal(std::string(lastComponent(folderOf(own))), depth - 1);
  const Bus ownBus = bus(own);
  return Linux::isInternal(ownBus, flag(name + "/removable"),
                           ownBus == Bus::mmc ? text(name + "/device/type") : std::string());
}

}  // namespace Varnel::Platform::Linux
