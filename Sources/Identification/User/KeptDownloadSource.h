// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

#include <Varnel/Identification/User/UserIdentificationProvider.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Finds the application's download once and keeps it, because finding it runs a program and reads
/// a database. All other questions go to another provider each time.
///
///     auto user = std::make_shared<KeptDownloadSource>(std::make_shared<UserIdentificator>());
///     show(user->downloadSourceURLString());                        // finds it
///     show(UserIdentificationInfo(user).uniqueClientIdentifier());  // knows it
///
/// One thread at a time.
class VARNEL_API KeptDownloadSource final : public UserIdentificationProvider {
 public:
  explicit KeptDownloadSource(std::shared_ptr<UserIdentificationProvider> provider);

  [[nodiscard]] std::optional<std::string> machineUUID() const override;
  [[nodiscard]] std::optional<std::string> serialNumber() const override;
  [[nodiscard]] std::string userIdentifier() const override;
  [[nodiscard]] std::optional<std::string> primaryMacAddress() const override;
  [[nodiscard]] std::optional<std::string> downloadSourceURLCid() const override;
  [[nodiscard]] std::optional<std::string> downloadSourceURLString() const override;
  [[nodiscard]] std::optional<std::string> GACookieValue() const override;

 private:
  const std::shared_ptr<UserIdentificationProvider> provider_;
  mutable std::optional<std::optional<std::string>> downloadSourceURL_;  ///< Absent until asked.
};

}  // namespace Varnel
