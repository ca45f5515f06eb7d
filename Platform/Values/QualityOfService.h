// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {

/// How urgent a piece of work is for the user. The numbers are those that desktop systems give
/// their quality-of-service classes; a value outside the list is treated as the most urgent one.
enum class QualityOfService : int {
  default_ = -1,
  background = 0x09,
  utility = 0x11,
  userInitiated = 0x19,
  userInteractive = 0x21,
};

}  // namespace Varnel::Platform
