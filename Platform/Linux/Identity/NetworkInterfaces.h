// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Linux/Disks/KernelFolder.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform::Linux {

/// The network interfaces as the kernel lists them in a folder such as /sys/class/net. Any thread.
class NetworkInterfaces final {
 public:
  explicit NetworkInterfaces(const std::string& folder);

  /// The first physical Ethernet-class interface that one of these rests on, itself included:
  /// bridges, bonds and virtual networks rest on others, a tunnel on none.
  [[nodiscard]] std::optional<std::string> physicalInterface(
      const std::vector<std::string>& names) const;

  /// The address that the hardware was made with; where it is not known, the present one.
  [[nodiscard]] std::optional<PropertyData> hardwareAddress(const std::string& name) const;

 private:
  [[nodiscard]] bool isPhysicalEthernet(const std::string& name) const;
  [[nodiscard]] std::vector<std::string> lowerInterfaces(const std::string& name) const;

  const KernelFolder folder_;
};

}  // namespace Varnel::Platform::Linux
