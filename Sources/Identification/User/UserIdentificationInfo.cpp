// SPDX-License-Identifier: MIT
#include <Varnel/Identification/User/UserIdentificationInfo.h>

#include <utility>

#include <Varnel/Context/TargetKind.h>

namespace Varnel {

UserIdentificationInfo::UserIdentificationInfo(
    std::shared_ptr<UserIdentificationProvider> identificator, const BuildSwitches& switches)
    : identificator_(std::move(identificator)),
      isSiteVersion_(TargetKind::of(switches) == TargetKind::site) {}

UserIdentificationInfo::UserIdentificationInfo(
    std::shared_ptr<UserIdentificationProvider> identificator)
    : UserIdentificationInfo(std::move(identificator), BuildSwitches::ofThisProduct()) {}

std::string UserIdentificationInfo::uniqueClientIdentifier() const {
  if (isSiteVersion_) {
    if (auto campaign = identificator_->downloadSourceURLCid()) return *campaign;
    if (auto client = identificator_->GACookieValue()) return *client;
  }
  return identificator_->userIdentifier();
}

}  // namespace Varnel
