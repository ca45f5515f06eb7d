// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>

namespace Varnel::Platform::Contract {

/// One disk, which may be mounted anywhere, also in several places.
class DiskArbitrationWorld : public World {
 public:
  virtual DiskArbitration& disks() = 0;
  virtual std::string disk() = 0;
  virtual URL mount(const std::string& name) = 0;
  virtual void unmount(const URL& folder) = 0;
  /// Before any session: from now on the service cannot be reached.
  virtual void loseService() = 0;
};

using DiskArbitrationContract = Suite<DiskArbitrationWorld>;

}  // namespace Varnel::Platform::Contract
