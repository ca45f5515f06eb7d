// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>

namespace Varnel::Platform::Contract {

/// A machine without any disks.
class DeviceRegistryWorld : public World {
 public:
  virtual DeviceRegistry& registry() = 0;
  /// A rotational disk "sda" or "sdb" with one partition, "sda1" or "sdb1".
  virtual void plug(const std::string& name, const std::string& serial) = 0;
  virtual void unplug(const std::string& name) = 0;
  /// A logical device on others.
  virtual void putOn(const std::string& name, const std::vector<std::string>& lower) = 0;
};

using DeviceRegistryContract = Suite<DeviceRegistryWorld>;

}  // namespace Varnel::Platform::Contract
