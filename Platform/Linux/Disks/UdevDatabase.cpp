// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/UdevDatabase.h>

#include <libudev.h>

#include <charconv>

#include <Varnel/Platform/Linux/Disks/BlockDevices.h>
#include <Varnel/Platform/Linux/Disks/KernelFolder.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Udev = UniqueHandle<udev*, udev_unref>;
using UdevDevice = UniqueHandle<udev_device*, udev_device_unref>;

}  // namespace

std::optional<std::string> udevProperty(const std::string& deviceName, const char* property) {
  const Udev context(udev_new());
  if (!context) return std::nullopt;
  const UdevDevice device(
      udev_device_new_from_subsystem_sysname(context.get(), "block", deviceName.c_str()));
  if (!device) return std::nullopt;
  const char* value = udev_device_get_property_value(device.get(), property);
  return value ? std::optional<std::string>(value) : std::nullopt;
}

std::map<std::string, std::string> fileSystemUUIDs(const char* folder) {
  std::map<std::string, std::string> uuids;
  const KernelFolder links(folder);
  if (!links) return uuids;
  for (const std::string& uuid : links.names())
    if (const auto target = links.link(uuid))
      uuids.emplace(lastComponent(*target), udevDecoded(uuid));
  return uuids;
}

std::string udevDecoded(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  while (!text.empty()) {
    unsigned char byte = 0;
    if (text.starts_with("\\x") && text.size() >= 4 &&
        std::from_chars(&text[2], &text[2] + 2, byte, 16).ptr == &text[2] + 2) {
      decoded += static_cast<char>(byte);
      text.remove_prefix(4);
    } else {
      decoded += text.front();
      text.remove_prefix(1);
    }
  }
  return decoded;
}

}  // namespace Varnel::Platform::Linux
