// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/InventedIdentifiers.h>

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

void InventedIdentifiers::endInventory() {
  known_ = std::exchange(asked_, {});
}

}  // namespace Varnel
