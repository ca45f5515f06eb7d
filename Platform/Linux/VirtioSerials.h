// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <mutex>
#include <string>

namespace Varnel::Platform::Linux {

/// The serial numbers of virtio disks. To read one is to send the disk a request, which takes its
/// turn behind all others, so each disk is asked once. Any thread.
class VirtioSerials final {
 public:
  /// The number of the disk with this sequence number, which no other disk has until the system is
  /// started anew. A disk without one is asked every time.
  [[nodiscard]] std::string of(const std::string& sequence,
                               const std::function<std::string()>& ask);

 private:
  std::mutex mutex_;  ///< Owns what follows; never held while a disk is asked.
  std::map<std::string, std::string> bySequence_;
};

}  // namespace Varnel::Platform::Linux
