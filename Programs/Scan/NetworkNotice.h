// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <set>
#include <string>

#include <Scan/Mounts.h>
#include <Scan/ScanObserver.h>

namespace Orvane {

/// Tells the observer once of each network file system that a scan comes to. For any thread.
class NetworkNotice final {
 public:
  explicit NetworkNotice(ScanObserver& observer) : observer_(observer) {}

  void sayIfNetwork(const ScanMount& mount) {
    if (mount.kind != ScanMount::Kind::network) return;
    const std::lock_guard lock(saying_);
    if (said_.insert(mount.path).second) observer_.networkEntered(mount.path);
  }

 private:
  std::mutex saying_;  ///< Held while the observer hears of what follows.
  ScanObserver& observer_;
  std::set<std::string> said_;
};

}  // namespace Orvane
