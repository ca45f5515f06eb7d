// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/InventedIdentifiers.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Values/UUID.h>

namespace Varnel {

std::string InventedIdentifiers::identifierFor(const OVDiskInfo::VolumeURLs& volumes) {
  std::string identifier;
  for (const Platform::URL& volume : volumes) {
    const auto found = known_.find(volume);
    if (found == known_.end()) continue;
    identifier = found->second;
    std::erase_if(known_, [&](const auto& entry) { return entry.second == identifier; });
    break;
  }
  if (identifier.empty()) identifier = Platform::randomUUIDString();
  for (const Platform::URL& volume : volumes) asked_.emplace(volume, identifier);
  return identifier;
}

bool InventedIdentifiers::hasInvented(const std::string& identifier) const {
  return std::any_of(known_.begin(), known_.end(),
                     [&](const auto& entry) { return entry.second == identifier; });
}

void InventedIdentifiers::endInventory() {
  known_ = std::exchange(asked_, {});
}

}  // namespace Varnel
