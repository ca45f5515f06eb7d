// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/MachineIdentity.h>

#include <algorithm>
#include <array>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/KernelFolder.h>
#include <Varnel/Platform/Linux/Identity/DefaultRoutes.h>
#include <Varnel/Platform/Linux/Identity/NetworkInterfaces.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel::Platform::Linux {
namespace {

// Empty when the file cannot be read. A router may know a million routes, each in a line of some
// 150 bytes.
std::string routes(const std::string& path) {
  constexpr std::size_t maxSize = std::size_t{512} << 20;
  return readFile(path, maxSize).valueOr("");
}

std::string lowerCased(std::string text) {
  for (char& c : text)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return text;
}

bool isOneCharacterRepeated(const std::string& text) {
  return text.find_first_not_of(text.front()) == std::string::npos;
}

// 32 hexadecimal digits. While a system is installed, the file says "uninitialized".
bool isMachineID(const std::string& text) {
  return text.size() == 32 && text.find_first_not_of("0123456789abcdef") == std::string::npos &&
         !isOneCharacterRepeated(text);
}

// Placeholders that makers of boards leave in place of an identity.
bool isPlaceholder(const std::string& text) {
  constexpr std::array<std::string_view, 21> placeholders = {
      "to be filled by o.e.m.",
      "to be filled by oem",
      "default string",
      "system serial number",
      "not specified",
      "not applicable",
      "not available",
      "none",
      "n/a",
      "na",
      "unknown",
      "invalid",
      "oem",
      "o.e.m.",
      "serial",
      "0123456789",
      "123456789",
      "1234567890",
      "1234567",
      "empty",
      "03000200-0400-0500-0006-000700080009"};
  const std::string lower = lowerCased(text);
  if (std::find(placeholders.begin(), placeholders.end(), lower) != placeholders.end()) return true;
  std::string digits = lower;
  std::erase(digits, '-');
  return digits.empty() || isOneCharacterRepeated(digits);
}

std::optional<PropertyValue> unlessPlaceholder(std::optional<std::string> text) {
  if (!text || isPlaceholder(*text)) return std::nullopt;
  return PropertyValue(std::move(*text));
}

class MachineFiles final : public MachineIdentity {
 public:
  explicit MachineFiles(std::string root) : root_(std::move(root)) {}

  std::optional<PropertyValue> platformProperty(std::string_view name) const override {
    if (name == "IOPlatformUUID") return uuid();
    if (name == "IOPlatformSerialNumber")
      return unlessPlaceholder(read("sys/class/dmi/id/product_serial"));
    return std::nullopt;
  }

  std::vector<PropertyData> primaryInterfaceAddresses() const override {
    const NetworkInterfaces interfaces(root_ + "/sys/class/net");
    const auto name = interfaces.physicalInterface(interfacesOfDefaultRoutes(
        routes(root_ + "/proc/net/route"), routes(root_ + "/proc/net/ipv6_route")));
    auto address = name ? interfaces.hardwareAddress(*name) : std::nullopt;
    if (!address) return {};
    return {std::move(*address)};
  }

 private:
  std::optional<std::string> read(const std::string& file) const {
    const auto bytes = KernelFolder(root_.c_str()).bytes(file);
    if (!bytes) return std::nullopt;
    return trimmed(*bytes);
  }

  // The identifier must not depend on who reads it. Everybody may read the machine's own, but only
  // root may read the board's: so the board's serves only where there is no other.
  std::optional<PropertyValue> uuid() const {
    for (const char* file : {"etc/machine-id", "var/lib/dbus/machine-id"}) {
      auto id = read(file);
      if (id && isMachineID(*id)) return PropertyValue(std::move(*id));
    }
    return unlessPlaceholder(read("sys/class/dmi/id/product_uuid"));
  }

  const std::string root_;
};

}  // namespace

std::unique_ptr<MachineIdentity> makeMachineIdentity(const std::string& root) {
  return std::make_unique<MachineFiles>(root);
}

}  // namespace Varnel::Platform::Linux
