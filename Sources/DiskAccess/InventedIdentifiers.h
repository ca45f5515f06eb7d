// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>

#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {

/// The identifiers that inventories invent for disks which tell none. A disk keeps its own from one
/// inventory to the next as long as one of its volumes stays mounted. One thread at a time.
///
///     InventedIdentifiers identifiers;
///     const auto disks = DiskInventory::take(ports, identifiers);
class InventedIdentifiers final {
 public:
  /// The identifier of a disk with these volumes. Asked for once for each such disk of an
  /// inventory.
  [[nodiscard]] std::string identifierFor(const OVDiskInfo::VolumeURLs& volumes);

  /// Forgets what this inventory has not asked for.
  void endInventory();

  /// Whether the identifier is one of these. Of disks that are gone it is not known for ever.
  [[nodiscard]] bool hasInvented(const std::string& identifier) const;

  /// A volume was unmounted: what is mounted there next may be another one.
  void forget(const Platform::URL& volumeURL) { known_.erase(volumeURL); }

 private:
  // Several disks may share a volume.
  using ByVolume = std::multimap<Platform::URL, std::string>;

  ByVolume known_;  ///< From earlier inventories, and not asked for in this one yet.
  ByVolume asked_;
};

}  // namespace Varnel
