// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Linux/Disks/KernelFolder.h>
#include <Varnel/Platform/Linux/Disks/StorageDevice.h>

namespace Varnel::Platform::Linux {

class VirtioSerials;

/// The kernel's table of block devices. Reads tables only and no device, except for what
/// `VirtioSerials` describes. Any thread.
class BlockDevices final {
 public:
  /// `folder` is where the devices are listed.
  explicit BlockDevices(const char* folder = "/sys/class/block")
      : devices_(std::make_shared<const KernelFolder>(folder)) {}

  explicit operator bool() const { return static_cast<bool>(*devices_); }

  [[nodiscard]] std::vector<std::string> names() const { return devices_->names(); }

  /// Where the device stands in the kernel's tree: "../../devices/…/block/sda/sda1". Empty when
  /// there is no such device.
  [[nodiscard]] std::string place(const std::string& name) const;

  /// The devices that a logical one is made of: the disks of a RAID, the partition of a volume.
  [[nodiscard]] std::vector<std::string> lowerDevices(const std::string& name) const;

  /// The facts of a whole disk, of which the serial numbers are read only if they will be used.
  [[nodiscard]] StorageDevice storageDevice(const std::string& name, std::string_view place,
                                            VirtioSerials& virtioSerials) const;

  /// Whether all of these disks, partitions or logical devices stay in the machine; absent when one
  /// does not tell, or there are none. A disk image does not stay: it comes and goes like a USB
  /// stick.
  [[nodiscard]] std::optional<bool> areInternal(const std::vector<std::string>& names) const;

 private:
  [[nodiscard]] Bus bus(std::string_view place) const;
  [[nodiscard]] bool flag(const std::string& path) const;
  [[nodiscard]] std::string text(const std::string& path) const;
  [[nodiscard]] std::string virtioSerial(const std::string& name, std::string_view place,
                                         VirtioSerials& virtioSerials) const;
  [[nodiscard]] std::optional<bool> areInternal(const std::vector<std::string>& names,
                                                int depth) const;
  [[nodiscard]] std::optional<bool> isInternal(const std::string& name, int depth) const;

  std::shared_ptr<const KernelFolder> devices_;
};

/// Whether a place is that of a device that the kernel makes up: a disk image, a RAID, a RAM disk.
[[nodiscard]] bool isVirtual(std::string_view place);

/// The last component of a path, and the path before it.
[[nodiscard]] std::string_view lastComponent(std::string_view path);
[[nodiscard]] std::string_view folderOf(std::string_view path);

}  // namespace Varnel::Platform::Linux
