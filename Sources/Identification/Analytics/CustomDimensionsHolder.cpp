// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>

#include <memory>
#include <mutex>
#include <utility>

#include <Varnel/Identification/Analytics/CustomDimensionValues.h>
#include <Varnel/Identification/Analytics/FoundValue.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <Varnel/Provenance/OVFriendsLocator.h>

namespace Varnel {
namespace {

struct Values {
  FoundValue<std::string> clientIdentifier;
  FoundValue<std::optional<std::string>> downloadSourceURL;

  std::mutex mutex;  // Owns what follows.
  double achievementsFractionCompleted = 0;
  std::int64_t scanCount = 0;
  std::int64_t cleanCount = 0;
  std::int64_t launchCount = 0;
};

Values& values() {
  static Values& ofThisProcess = *new Values();
  return ofThisProcess;
}

template <typename Value>
auto read(Value Values::*member) {
  const std::lock_guard lock(values().mutex);
  return values().*member;
}

template <typename Value>
void assign(Value Values::*member, Value value) {
  const std::lock_guard lock(values().mutex);
  values().*member = value;
}

}  // namespace

std::string CustomDimensionsHolder::clientIdentifier() {
  return values().clientIdentifier.get([] {
    return UserIdentificationInfo(std::make_shared<UserIdentificator>()).uniqueClientIdentifier();
  });
}
void CustomDimensionsHolder::setClientIdentifier(std::string identifier) {
  values().clientIdentifier.set(std::move(identifier));
}

std::optional<std::string> CustomDimensionsHolder::downloadSourceURL() {
  return values().downloadSourceURL.get(
      [] { return UserIdentificator().downloadSourceURLString(); });
}
void CustomDimensionsHolder::setDownloadSourceURL(std::optional<std::string> url) {
  values().downloadSourceURL.set(std::move(url));
}

double CustomDimensionsHolder::achievementsFractionCompleted() {
  return read(&Values::achievementsFractionCompleted);
}
void CustomDimensionsHolder::setAchievementsFractionCompleted(double fraction) {
  assign(&Values::achievementsFractionCompleted, fraction);
}
std::int64_t CustomDimensionsHolder::scanCount() {
  return read(&Values::scanCount);
}
void CustomDimensionsHolder::setScanCount(std::int64_t count) {
  assign(&Values::scanCount, count);
}
std::int64_t CustomDimensionsHolder::cleanCount() {
  return read(&Values::cleanCount);
}
void CustomDimensionsHolder::setCleanCount(std::int64_t count) {
  assign(&Values::cleanCount, count);
}
std::int64_t CustomDimensionsHolder::launchCount() {
  return read(&Values::launchCount);
}
void CustomDimensionsHolder::setLaunchCount(std::int64_t count) {
  assign(&Values::launchCount, count);
}

const std::string& CustomDimensionsHolder::otherAppsAvailabilityString() {
  static const std::string& digits = *new std::string([] {
    std::string found;
    for (const bool isInstalled :
         {OVFriendsLocator::isKelvane2Installed(), OVFriendsLocator::isKelvane3Installed(),
          OVFriendsLocator::isOrvane1MASInstalled(), OVFriendsLocator::isOrvane1SiteInstalled(),
          OVFriendsLocator::isDrumlinInstalled(), OVFriendsLocator::isVeltMASInstalled(),
          OVFriendsLocator::isVeltSiteInstalled()})
      found += isInstalled ? '1' : '0';
    return found;
  }());
  return digits;
}

Tallyhouse::CustomDimensions CustomDimensionsHolder::customDimensions() {
  return CustomDimensionValues{.clientIdentifier = clientIdentifier(),
                               .downloadSourceURL = downloadSourceURL(),
                               .achievementsFractionCompleted = achievementsFractionCompleted(),
                               .scanCount = scanCount(),
                               .cleanCount = cleanCount(),
                               .launchCount = launchCount(),
                               .otherAppsAvailabilityString = otherAppsAvailabilityString()}
      .customDimensions();
}

}  // namespace Varnel
