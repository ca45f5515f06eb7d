// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

struct _GSource;

namespace Varnel::Platform::Linux {

/// Lets the source run the block once, on the main thread. The caller owns the source. Any thread.
_GSource* attach(_GSource* source, int priority, std::function<void()> block);

/// Runs the block on the main thread, from the main loop. Any thread.
void runOnMainLoop(std::function<void()> block);

}  // namespace Varnel::Platform::Linux
