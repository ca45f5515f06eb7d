// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Values/UniqueHandle.h>

struct _GSource;

namespace Varnel::Platform::Linux {

/// Lets the source run the block once, on the main thread. The caller owns the source. Any thread.
_GSource* attach(_GSource* source, int priority, std::function<void()> block);

/// Takes an attached source out of the main loop.
void detach(_GSource* source);
using AttachedSource = UniqueHandle<_GSource*, detach>;

/// Runs the block on the main thread, from the main loop. Any thread.
void runOnMainLoop(std::function<void()> block);

}  // namespace Varnel::Platform::Linux
