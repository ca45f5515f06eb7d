// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/TimeZones.h>

namespace Varnel::Platform::Contract {

/// A system that knows the zones of `zonesOf2026`.
class TimeZonesWorld : public World {
 public:
  virtual TimeZones& zones() = 0;
  virtual void moveUser(const std::string& zone) = 0;
};

using TimeZonesContract = Suite<TimeZonesWorld>;

}  // namespace Varnel::Platform::Contract
