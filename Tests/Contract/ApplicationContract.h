// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/Application.h>

namespace Varnel::Platform::Contract {

/// An application that has just started.
class ApplicationWorld : public World {
 public:
  virtual Platform::Application& application() = 0;
};

using ApplicationContract = Suite<ApplicationWorld>;

}  // namespace Varnel::Platform::Contract
