// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Has `function` called in every child that the process forks from now on, before `fork` returns
/// there. Only the forking thread lives on in the child. Whatever other threads were doing or
/// holding stays so for ever, and `function` must not touch it. On a system without such children
/// it is never called.
VARNEL_API void callInForkedChildren(void (*function)());

/// Has `function` called before each fork from now on, on the thread that forks.
VARNEL_API void callBeforeForks(void (*function)());

/// How often the process has forked on the way from the first call to here. An object that was made
/// at another count is the parent's: its threads are missing, and its locks may be held for ever.
[[nodiscard]] VARNEL_API int forksSoFar();

}  // namespace Varnel::Platform
