// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

/// An application's settings of this user, kept from run to run and shared by the processes of the
/// application: each sees at once what another has set. Any thread.
///
///     if (const auto error = defaults.set("scans", std::int64_t{3})) report(*error);
///     defaults.integer("scans").value_or(0);
///
/// Each call may read or write a file; what is asked often is kept by its user.
class VARNEL_API UserDefaults {
 public:
  using Value = std::variant<bool, std::int64_t, double, std::string>;

  virtual ~UserDefaults() = default;
  UserDefaults& operator=(const UserDefaults&) = delete;

  /// The value under a key; absent when there is none, or when it cannot be read as this type.
  [[nodiscard]] virtual std::optional<bool> truthValue(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<std::int64_t> integer(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<double> real(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<std::string> text(const std::string& key) const = 0;

  /// Keeps a value under a key on disk, and leaves all other keys as they are there. Returns
  /// nothing when it is kept, else why not; the earlier value then stays. A key must not be empty,
  /// and texts are UTF-8 without null characters (`invalid_argument` otherwise). Blocks as writing
  /// to a disk does, and up to a second for another process that writes.
  [[nodiscard]] virtual std::optional<PlatformError> set(const std::string& key,
                                                         const Value& value) = 0;
  /// The same for removing a key; one that is not there is removed.
  [[nodiscard]] virtual std::optional<PlatformError> remove(const std::string& key) = 0;
};

}  // namespace Varnel::Platform
