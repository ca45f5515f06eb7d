// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Supplies the facts that tell one installation from another. A fact that the machine does not
/// give is absent; `userIdentifier()` alone always has a text. Threads as the implementation's.
class VARNEL_API UserIdentificationProvider {
 public:
  virtual ~UserIdentificationProvider() = default;

  [[nodiscard]] virtual std::optional<std::string> machineUUID() const = 0;
  [[nodiscard]] virtual std::optional<std::string> serialNumber() const = 0;
  /// Stable for one user of one machine.
  [[nodiscard]] virtual std::string userIdentifier() const = 0;
  /// The address of the primary network interface, as in "00:1b:63:84:45:e6".
  [[nodiscard]] virtual std::optional<std::string> primaryMacAddress() const = 0;
  /// The "cid" item of the download's URL.
  [[nodiscard]] virtual std::optional<std::string> downloadSourceURLCid() const = 0;
  /// The URL that the application was downloaded from. Reads files and may wait for a program.
  [[nodiscard]] virtual std::optional<std::string> downloadSourceURLString() const = 0;
  /// The client id of the vendor's web-analytics cookie.
  [[nodiscard]] virtual std::optional<std::string> GACookieValue() const = 0;
};

}  // namespace Varnel
