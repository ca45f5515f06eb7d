// SPDX-License-Identifier: MIT
#include <Platform/Ports/DeviceRegistry.h>

#include <Platform/Linux/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {
class SysfsDeviceRegistry final : public DeviceRegistry {
 public:
  std::optional<Entries> entriesMatchingProperty(std::string_view, const PropertyValue&) override {
    return std::nullopt;
  }
};
}  // namespace

std::unique_ptr<DeviceRegistry> makeDeviceRegistry() {
  return std::make_unique<SysfsDeviceRegistry>();
}

}  // namespace Varnel::Platform::Linux
