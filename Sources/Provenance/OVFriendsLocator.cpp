// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/OVFriendsLocator.h>

#include <utility>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel {
namespace {

bool isInstalled(const char* bundleIdentifier) {
  return OVFriendsLocator::workspace()->applicationURL(bundleIdentifier).has_value();
}

}  // namespace

OVFriendsLocator& OVFriendsLocator::sharedLocator() {
  static auto& shared = *new OVFriendsLocator;
  return shared;
}

std::shared_ptr<Platform::Workspace> OVFriendsLocator::workspace() {
  OVFriendsLocator& locator = sharedLocator();
  const std::lock_guard lock(locator.mutex_);
  // The process's ports are never destroyed.
  if (!locator.workspace_)
    locator.workspace_ = {std::shared_ptr<void>(), &Platform::processPorts().workspace.get()};
  return locator.workspace_;
}

void OVFriendsLocator::setWorkspace(std::shared_ptr<Platform::Workspace> workspace) {
  const std::lock_guard lock(mutex_);
  workspace_ = std::move(workspace);
}

bool OVFriendsLocator::isKelvaneClassicInstalled() {
  return isInstalled("com.quennel.Kelvane");
}
bool OVFriendsLocator::isKelvane2Installed() {
  return isInstalled("com.quennel.Kelvane2");
}
bool OVFriendsLocator::isKelvane3Installed() {
  return isInstalled("com.quennel.Kelvane3");
}
bool OVFriendsLocator::isOrvane1MASInstalled() {
  return isInstalled("com.quennel.Orvane");
}
bool OVFriendsLocator::isOrvane1SiteInstalled() {
  return isInstalled("com.quennel.site.Orvane");
}
bool OVFriendsLocator::isOrvane2Installed() {
  return isInstalled("com.quennel.Orvane2");
}
bool OVFriendsLocator::isVeltMASInstalled() {
  return isInstalled("com.quennel.Velt2");
}
bool OVFriendsLocator::isVeltSiteInstalled() {
  return isInstalled("com.quennel.trial.Velt2") || isInstalled("com.quennel.site.Velt2");
}
bool OVFriendsLocator::isDrumlinInstalled() {
  return isInstalled("com.quennel.Drumlin");
}
bool OVFriendsLocator::isBrambleInstalled() {
  return isInstalled("com.quennel.Bramble");
}

bool OVFriendsLocator::isKelvaneInstalled() {
  return isKelvane3Installed() || isKelvane2Installed() || isKelvaneClassicInstalled();
}
bool OVFriendsLocator::isOrvane1Installed() {
  return isOrvane1MASInstalled() || isOrvane1SiteInstalled();
}
bool OVFriendsLocator::isVeltInstalled() {
  return isVeltMASInstalled() || isVeltSiteInstalled();
}

}  // namespace Varnel
