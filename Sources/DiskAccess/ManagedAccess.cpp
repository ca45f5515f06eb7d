// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/ManagedAccess.h>

#include <utility>

#include <Varnel/DiskAccess/DiskAccessManager.h>

namespace Varnel {

std::unique_ptr<DiskAccessingSession> beginManagedAccessing(
    const Platform::URL& url, std::string propose, bool enableSecureScopedAccess,
    std::optional<Platform::TimeInterval> accessWaitingTimeout,
    const std::optional<Platform::URL>& volumeURL) {
  return DiskAccessManager::shared().beginAccessingURL(
      url, std::move(propose), Platform::QualityOfService::utility, enableSecureScopedAccess,
      accessWaitingTimeout, volumeURL);
}

}  // namespace Varnel
