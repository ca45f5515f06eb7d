// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Has `function` called in every child that the process forks from now on, before `fork` returns
/// there. The child is a copy with the forking thread alone: what other threads did or held stands
/// still for ever, and `function` leaves it alone. On a system without such children it is never
/// called.
VARNEL_API void callInForkedChildren(void (*function)());

}  // namespace Varnel::Platform
