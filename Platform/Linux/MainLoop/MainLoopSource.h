// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Varnel/Platform/Values/UniqueHandle.h>

struct _GSource;

namespace Varnel::Platform::Linux {

/// Calls back on the main thread whenever a file descriptor is readable, as long as it lives. The
/// caller owns the descriptor; with -1 nothing is watched. Main thread only.
class MainLoopSource final {
 public:
  MainLoopSource(int descriptor, std::function<void()> readable);
  MainLoopSource(const MainLoopSource&) = delete;
  MainLoopSource& operator=(const MainLoopSource&) = delete;

 private:
  static void destroy(_GSource* source);

  UniqueHandle<_GSource*, destroy> source_;
};

}  // namespace Varnel::Platform::Linux
