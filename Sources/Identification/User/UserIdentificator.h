// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Identification/User/UserIdentificationProvider.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Provenance/KVDownloadSourceTracker.h>

namespace Varnel::Platform {
class CookieStorage;
class MachineIdentity;
class UserAccount;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

/// Gathers the identifiers by which the suite recognises one installation.
///
///     UserIdentificator identificator;
///     identificator.userIdentifier();       // 64 hexadecimal digits
///     identificator.downloadSourceURLCid(); // the campaign, if the download's URL names one
///
/// Machine UUID, serial number and user identifier are computed once, or assigned; the others are
/// found anew at each reading. Those of the download block for as long as the tracker takes. One
/// thread at a time. Nothing fails or is logged: a fact that cannot be found is absent.
class VARNEL_API UserIdentificator final : public UserIdentificationProvider {
 public:
  /// The services that the object asks; they outlive it.
  struct Ports {
    Platform::CookieStorage& cookieStorage;
    Platform::MachineIdentity& machineIdentity;
    Platform::UserAccount& userAccount;
    KVDownloadSourceTracker::Ports downloadSource;
  };

  UserIdentificator();
  explicit UserIdentificator(const Platform::Ports& ports);
  /// `cookieDomain` is that of the vendor's web-analytics cookie, by default the product's; without
  /// one there is no cookie.
  UserIdentificator(Ports ports, std::string cookieDomain);
  UserIdentificator(const UserIdentificator&) = delete;
  UserIdentificator& operator=(const UserIdentificator&) = delete;

  [[nodiscard]] std::optional<std::string> machineUUID() const override;
  void setMachineUUID(std::optional<std::string> uuid);

  [[nodiscard]] std::optional<std::string> serialNumber() const override;
  void setSerialNumber(std::optional<std::string> number);

  /// A digest of machine UUID and login name; "(null)" where either is not text.
  [[nodiscard]] std::string userIdentifier() const override;
  void setUserIdentifier(std::string identifier);

  [[nodiscard]] std::optional<std::string> primaryMacAddress() const override;
  [[nodiscard]] std::optional<std::string> downloadSourceURLCid() const override;
  [[nodiscard]] std::optional<std::string> downloadSourceURLString() const override;
  [[nodiscard]] std::optional<std::string> GACookieValue() const override;

 private:
  using Text = std::optional<std::string>;
  [[nodiscard]] Text platformText(std::string_view property) const;

  const Ports ports_;
  const std::string cookieDomain_;
  // Absent until read or assigned; the absence of an identifier is kept as well.
  mutable std::optional<Text> machineUUID_;
  mutable std::optional<Text> serialNumber_;
  mutable Text userIdentifier_;
};

/// The name under which the interface layer knows the class.
using OVUserIdentificator = UserIdentificator;

}  // namespace Varnel
