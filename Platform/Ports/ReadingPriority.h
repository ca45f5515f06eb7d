// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// How much the calling thread's reading of disks gives way to that of other threads and programs.
/// Whether a thread begins with the level of the one that started it is up to the system. Any
/// thread.
///
///     const auto normal = priority.current();
///     if (normal) priority.set(priority.lowered(*normal));
///     read(file);
///     if (normal) priority.set(*normal);
class VARNEL_API ReadingPriority {
 public:
  /// A number of the system's own.
  using Level = int;

  virtual ~ReadingPriority() = default;
  ReadingPriority& operator=(const ReadingPriority&) = delete;

  /// The calling thread's level; absent where the system tells none.
  [[nodiscard]] virtual std::optional<Level> current() = 0;

  /// The level of the process's main thread; absent likewise.
  [[nodiscard]] virtual std::optional<Level> ofMainThread() = 0;

  /// Does nothing where the system forbids it.
  virtual void set(Level level) = 0;

  /// The level at which a thread of this level gives way; the same if it does already, or could not
  /// come back.
  [[nodiscard]] virtual Level lowered(Level normal) = 0;
};

}  // namespace Varnel::Platform
