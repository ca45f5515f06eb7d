// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Ports/MachineIdentity.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A machine whose identity the test sets; an empty text or address is none. Set it before other
/// threads read.
class FakeMachineIdentity final : public MachineIdentity {
 public:
  /// Questions. One that goes wrong finds nothing.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  PropertyDictionary properties = {{"IOPlatformUUID", "0f1e2d3c4b5a69788796a5b4c3d2e1f0"},
                                   {"IOPlatformSerialNumber", "C02XL0FAKE"}};
  std::vector<PropertyData> addresses;
  mutable std::atomic<int> questions = 0;  ///< How often a property was asked for.

  [[nodiscard]] std::optional<PropertyValue> platformProperty(
      std::string_view name) const override {
    ++questions;
    if (faults->strikes()) return std::nullopt;
    const PropertyValue* value = find(properties, name);
    if (!value || *value == PropertyValue("")) return std::nullopt;
    return *value;
  }
  [[nodiscard]] std::vector<PropertyData> primaryInterfaceAddresses() const override {
    auto present = faults->strikes() ? std::vector<PropertyData>() : addresses;
    std::erase(present, PropertyData());
    return present;
  }
};

}  // namespace Varnel::Platform::Testing
