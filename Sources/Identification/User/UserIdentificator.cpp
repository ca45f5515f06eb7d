// SPDX-License-Identifier: MIT
#include <Varnel/Identification/User/UserIdentificator.h>

#include <memory>
#include <utility>

#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Identification/User/IdentifierRules.h>
#include <Varnel/Platform/Ports/CookieStorage.h>
#include <Varnel/Platform/Ports/MachineIdentity.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Provenance/KVQuarantine.h>

namespace Varnel {
namespace {

constexpr const char* cookieGroup = "Cookies";

}  // namespace

UserIdentificator::UserIdentificator() : UserIdentificator(Platform::processPorts()) {}

UserIdentificator::UserIdentificator(const Platform::Ports& ports)
    : UserIdentificator({.cookieStorage = ports.cookieStorage,
                         .machineIdentity = ports.machineIdentity,
                         .userAccount = ports.userAccount,
                         .downloadSource = KVDownloadSourceTracker::Ports::of(ports)},
                        BuildSwitches::ofThisProduct().cookieDomain) {}

UserIdentificator::UserIdentificator(Ports ports, std::string cookieDomain)
    : ports_(ports), cookieDomain_(std::move(cookieDomain)) {}

UserIdentificator::Text UserIdentificator::platformText(std::string_view property) const {
  const auto value = ports_.machineIdentity.platformProperty(property);
  const auto* text = value ? value->as<std::string>() : nullptr;
  if (!text) return std::nullopt;
  return *text;
}

std::optional<std::string> UserIdentificator::machineUUID() const {
  if (!machineUUID_) machineUUID_ = platformText("IOPlatformUUID");
  return *machineUUID_;
}
void UserIdentificator::setMachineUUID(std::optional<std::string> uuid) {
  machineUUID_ = std::move(uuid);
}

std::optional<std::string> UserIdentificator::serialNumber() const {
  if (!serialNumber_) serialNumber_ = platformText("IOPlatformSerialNumber");
  return *serialNumber_;
}
void UserIdentificator::setSerialNumber(std::optional<std::string> number) {
  serialNumber_ = std::move(number);
}

std::string UserIdentificator::userIdentifier() const {
  if (!userIdentifier_)
    userIdentifier_ = userIdentifierOf(machineUUID(), ports_.userAccount.name());
  return *userIdentifier_;
}
void UserIdentificator::setUserIdentifier(std::string identifier) {
  userIdentifier_ = std::move(identifier);
}

std::optional<std::string> UserIdentificator::primaryMacAddress() const {
  return macAddressOf(ports_.machineIdentity.primaryInterfaceAddresses());
}

std::optional<std::string> UserIdentificator::downloadSourceURLString() const {
  auto quarantine = std::make_shared<KVQuarantine>(
      KVQuarantine::systemQuarantinePathV2(ports_.userAccount), ports_.downloadSource.systemLog);
  const KVDownloadSourceTracker tracker(std::move(quarantine), {}, ports_.downloadSource);
  const auto entry = tracker.installSourceEntry();
  const auto url = entry ? entry->dataURLString() : std::nullopt;
  return url ? Text(*url) : std::nullopt;
}

std::optional<std::string> UserIdentificator::downloadSourceURLCid() const {
  const auto url = downloadSourceURLString();
  return url ? campaignOf(*url) : std::nullopt;
}

std::optional<std::string> UserIdentificator::GACookieValue() const {
  if (cookieDomain_.empty()) return std::nullopt;
  Platform::CookieStorage& storage = ports_.cookieStorage;
  const auto cookies = storage.hasGroupContainers() ? storage.cookiesOfGroupContainer(cookieGroup)
                                                    : storage.cookies();
  return clientIdentifierIn(cookies, cookieDomain_);
}

}  // namespace Varnel
