// SPDX-License-Identifier: MIT
#include <Varnel/Context/TargetKind.h>

#include <algorithm>

#include <Varnel/Basalt/Assertions.h>
#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel {
namespace {

constexpr UserFeatures promotedFeatures = {UserFeatures::sharing, UserFeatures::crossPromo,
                                           UserFeatures::achievements, UserFeatures::irate};

struct Channel {
  std::string bundleID;
  const char* availabilityKey;
  bool hasUpdater;
  UserFeatures defaultFeatures;
};

const Channel& channel(TargetKind kind) {
  static const std::array<Channel, 3> channels = {{
      {"com.quennel.Orvane2", "isAvailableInAppStore", false, {}},
      {"com.quennel.Orvane-marketta", "isAvailableInMarketta", false, promotedFeatures},
      {"com.quennel.site.Orvane2", "isAvailableInSite", true, promotedFeatures},
  }};
  return channels[static_cast<std::size_t>(kind.rawValue())];
}

Platform::Workspace& processWorkspace() {
  return Platform::processPorts().workspace;
}

template <typename Predicate>
std::vector<TargetKind> targetsWhere(Predicate isWanted) {
  std::vector<TargetKind> targets;
  std::ranges::copy_if(TargetKind::allValues(), std::back_inserter(targets), isWanted);
  return targets;
}

}  // namespace

std::optional<TargetKind> TargetKind::withBundleID(std::string_view bundleID) {
  for (const TargetKind kind : allValues())
    if (kind.bundleID() == bundleID) return kind;
  return std::nullopt;
}

const std::array<TargetKind, 3>& TargetKind::allValues() {
  static constexpr std::array<TargetKind, 3> values = {appstore, marketta, site};
  return values;
}

TargetKind TargetKind::current() {
  static const TargetKind kind = of(BuildSwitches::ofThisProduct());
  return kind;
}

TargetKind TargetKind::of(const BuildSwitches& switches) {
  if (switches.isAppStoreVersion) return appstore;
  if (switches.isSiteVersion) return site;
  if (switches.isMarkettaVersion) return marketta;
  Basalt::assertUnreachable("TargetKind", __LINE__);
}

const std::string& TargetKind::bundleID() const {
  return channel(*this).bundleID;
}

bool TargetKind::hasUpdater() const {
  return channel(*this).hasUpdater;
}

std::optional<Platform::URL> TargetKind::urlOfInstance() const {
  return urlOfInstance(processWorkspace());
}

std::optional<Platform::URL> TargetKind::urlOfInstance(Platform::Workspace& workspace) const {
  return workspace.applicationURL(bundleID());
}

bool TargetKind::isInstalled() const {
  return urlOfInstance().has_value();
}

std::vector<TargetKind> TargetKind::findInstalledTargets() {
  return findInstalledTargets(processWorkspace());
}

std::vector<TargetKind> TargetKind::findInstalledTargets(Platform::Workspace& workspace) {
  return targetsWhere([&](TargetKind kind) { return kind.urlOfInstance(workspace).has_value(); });
}

std::vector<TargetKind> TargetKind::findOtherInstalledTargets() const {
  return findOtherInstalledTargets(processWorkspace());
}

std::vector<TargetKind> TargetKind::findOtherInstalledTargets(
    Platform::Workspace& workspace) const {
  return targetsWhere(
      [&](TargetKind kind) { return kind != *this && kind.urlOfInstance(workspace).has_value(); });
}

std::optional<bool> TargetKind::extractIsAvailable(const Basalt::JSON& dictionary) const {
  const auto* values = dictionary.as<Platform::PropertyDictionary>();
  const bool* flag =
      values ? Platform::findAs<bool>(*values, channel(*this).availabilityKey) : nullptr;
  if (!flag) return std::nullopt;
  return *flag;
}

UserFeatures TargetKind::defaultUserFeatures() const {
  return channel(*this).defaultFeatures;
}

UserFeatures TargetKind::userFeatures(std::optional<UserFeatures> withSuggestion) const {
  if (!withSuggestion) return defaultUserFeatures();
  if (*this == appstore) return *withSuggestion;
  return withSuggestion->union_(defaultUserFeatures());
}

}  // namespace Varnel
