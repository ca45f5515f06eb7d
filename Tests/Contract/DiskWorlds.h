// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel::Platform::Contract {

/// A machine without any disks.
class DeviceRegistryWorld : public WorldOf<DeviceRegistry> {
 public:
  /// A rotational disk "sda" or "sdb" with one partition, "sda1" or "sdb1".
  virtual void plug(const std::string& name, const std::string& serial) = 0;
  virtual void unplug(const std::string& name) = 0;
  /// A logical device on others.
  virtual void putOn(const std::string& name, const std::vector<std::string>& lower) = 0;
};
using DeviceRegistryContract = Suite<DeviceRegistryWorld>;

/// One disk, which may be mounted anywhere, also in several places.
class DiskArbitrationWorld : public WorldOf<DiskArbitration> {
 public:
  virtual std::string disk() = 0;
  virtual URL mount(const std::string& name) = 0;
  virtual void unmount(const URL& folder) = 0;
  /// Before any session: from now on the service cannot be reached.
  virtual void loseService() = 0;
};
using DiskArbitrationContract = Suite<DiskArbitrationWorld>;

/// A machine with a volume at the root.
class VolumeCatalogWorld : public WorldOf<VolumeCatalog> {
 public:
  /// The path of an empty folder of this name.
  virtual std::string folder(const std::string& name) = 0;
  virtual void mount(const URL& folder) = 0;
  virtual void unmount(const URL& folder) = 0;
  /// Mounts a pseudo file system of the kernel's, which stays.
  virtual void mountPseudo(const URL& folder) = 0;
};
using VolumeCatalogContract = Suite<VolumeCatalogWorld>;

}  // namespace Varnel::Platform::Contract
