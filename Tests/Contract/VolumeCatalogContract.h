// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel::Platform::Contract {

/// A machine with a volume at the root.
class VolumeCatalogWorld : public World {
 public:
  virtual VolumeCatalog& catalog() = 0;
  /// The path of an empty folder of this name.
  virtual std::string folder(const std::string& name) = 0;
  virtual void mount(const URL& folder) = 0;
  virtual void unmount(const URL& folder) = 0;
};

using VolumeCatalogContract = Suite<VolumeCatalogWorld>;

}  // namespace Varnel::Platform::Contract
