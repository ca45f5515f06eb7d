// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// The facts of a storage device, and what follows from them. Plain functions over plain data.
namespace Varnel::Platform::Linux {

/// How a disk is attached, as far as it matters here.
enum class Bus { none, nvme, scsi, virtio, mmc, usb, firewire, other };

/// The facts of one whole disk. A text that the system does not give is empty.
struct StorageDevice {
  Bus bus = Bus::none;
  bool isRemovable = false;
  bool isHidden = false;
  bool isSolidState = false;
  std::string serialNumber;    ///< As the device's driver tells it.
  std::string serialPage;      ///< The SCSI product data page 0x80, raw.
  std::string recordedSerial;  ///< What udev recorded when the device was plugged in.
  std::string worldWideName;
  std::string place;  ///< In the kernel's tree of devices.
};

/// The bus that a chain of subsystems tells, that of the disk's own device first. A SCSI disk may
/// hang on USB, so links further from the disk count more.
[[nodiscard]] Bus busOf(const std::vector<std::string>& subsystems);

/// Whether the chain needs no further link to tell the bus.
[[nodiscard]] bool decidesBus(std::string_view subsystem);

/// Fixed disks on the buses that carry health reports. Bridges on USB hide them.
[[nodiscard]] bool isSmartCapable(const StorageDevice& device);

/// "Solid State" or "Rotational".
[[nodiscard]] std::string_view mediumType(const StorageDevice& device);

/// The device's serial number; without one its world-wide name, and at last its place, so that the
/// next inventory knows the disk again.
[[nodiscard]] std::string identifyingSerial(const StorageDevice& device);

/// The text in a SCSI product data page 0x80; empty when the page is malformed.
[[nodiscard]] std::string serialInPage(std::string_view page);

/// Whether a disk of this bus and these facts stays in the machine; absent when the bus does not
/// tell. `cardType` is "SD" for a card that can be drawn.
[[nodiscard]] std::optional<bool> isInternal(Bus bus, bool isRemovable, std::string_view cardType);

}  // namespace Varnel::Platform::Linux
