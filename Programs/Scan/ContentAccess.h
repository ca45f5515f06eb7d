// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace Orvane {

/// Permission to read file contents. The scan opens and reads files only inside `whileAccessing`,
/// so the implementation decides how many readers a disk has at once. Any thread.
class ContentAccess {
 public:
  virtual ~ContentAccess() = default;

  /// Waits until the disk that holds the file may be read, runs `read` on the calling thread and
  /// gives the disk back, also when `read` throws. False, without running it, when the file may not
  /// be read at all. Calls are not nested.
  [[nodiscard]] virtual bool whileAccessing(const std::string& path, std::uint64_t device,
                                            const std::function<void()>& read) = 0;
};

}  // namespace Orvane
