// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <mutex>
#include <string>

namespace Varnel::Platform::Linux {

/// The serial numbers of virtio disks. Reading one sends the disk a request, which takes its turn
/// behind all others. So each disk is asked once, on a thread of its own, and callers do not wait
/// long for the answer. A disk that does not answer in time has no number from then on: with a
/// number that came later, it would count as a second disk. Any thread.
class VirtioSerials final {
 public:
  explicit VirtioSerials(std::chrono::milliseconds patience = std::chrono::milliseconds(100))
      : patience_(patience) {}

  /// The number of the disk that this key tells from all others; empty when it has none. `ask` owns
  /// what it uses, because it may still run long after this call.
  [[nodiscard]] std::string of(const std::string& disk, std::function<std::string()> ask);

 private:
  const std::chrono::milliseconds patience_;
  std::mutex mutex_;  ///< Owns what follows; never held while a disk is asked.
  std::map<std::string, std::string> byDisk_;
};

}  // namespace Varnel::Platform::Linux
