// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform {

/// The facts that distinguish this machine from others. Any thread; calls read kernel tables and
/// small files. It is a port beside `DeviceRegistry`, because on most systems half of these facts
/// belong to no device.
class VARNEL_API MachineIdentity {
 public:
  virtual ~MachineIdentity() = default;
  MachineIdentity& operator=(const MachineIdentity&) = delete;

  /// A property of the machine as a whole: "IOPlatformUUID" or "IOPlatformSerialNumber", both texts
  /// that are not empty. Absent when the machine has none or hides it, and for any other name.
  [[nodiscard]] virtual std::optional<PropertyValue> platformProperty(
      std::string_view name) const = 0;

  /// The hardware address of each network interface that the system calls primary, in its order;
  /// an interface without one is left out. Usually one, of six bytes.
  [[nodiscard]] virtual std::vector<PropertyData> primaryInterfaceAddresses() const = 0;
};

}  // namespace Varnel::Platform
