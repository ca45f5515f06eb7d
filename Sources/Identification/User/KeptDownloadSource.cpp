// SPDX-License-Identifier: MIT
#include <Varnel/Identification/User/KeptDownloadSource.h>

#include <utility>

#include <Varnel/Identification/User/IdentifierRules.h>

namespace Varnel {

using Text = std::optional<std::string>;

KeptDownloadSource::KeptDownloadSource(std::shared_ptr<UserIdentificationProvider> provider)
    : provider_(std::move(provider)) {}

Text KeptDownloadSource::machineUUID() const {
  return provider_->machineUUID();
}
Text KeptDownloadSource::serialNumber() const {
  return provider_->serialNumber();
}
std::string KeptDownloadSource::userIdentifier() const {
  return provider_->userIdentifier();
}
Text KeptDownloadSource::primaryMacAddress() const {
  return provider_->primaryMacAddress();
}
Text KeptDownloadSource::GACookieValue() const {
  return provider_->GACookieValue();
}

Text KeptDownloadSource::downloadSourceURLString() const {
  if (!downloadSourceURL_) downloadSourceURL_ = provider_->downloadSourceURLString();
  return *downloadSourceURL_;
}

Text KeptDownloadSource::downloadSourceURLCid() const {
  const Text url = downloadSourceURLString();
  return url ? campaignOf(*url) : std::nullopt;
}

}  // namespace Varnel
