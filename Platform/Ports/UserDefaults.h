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
/// Every value is kept as text, which people may edit, and reads as each type that the text spells:
/// the integer 3 also as the real 3.0 and as "3", the text "true" also as the truth.
///
/// Each call may read or write a file; what is asked often is kept by its user.
class VARNEL_API UserDefaults {
 public:
  using Value = std::variant<bool, std::int64_t, double, std::string>;

  virtual ~UserDefaults() = default;
  UserDefaults& operator=(const UserDefaults&) = delete;

  /// The value under a key; absent when there is none, or when its text spells no such value: the
  /// truth is "true" or "1", its contrary "false" or "0", and a number stands alone and fits.
  [[nodiscard]] std::optional<bool> truthValue(const std::string& key) const;
  [[nodiscard]] std::optional<std::int64_t> integer(const std::string& key) const;
  [[nodiscard]] std::optional<double> real(const std::string& key) const;
  [[nodiscard]] std::optional<std::string> text(const std::string& key) const;

  /// Keeps a value under a key on disk, and leaves all other keys as they are there. Returns
  /// nothing when it is kept, else why not; the earlier value then stays. A key must not be empty,
  /// and keys and texts are UTF-8 without null characters (`invalid_argument` otherwise). All
  /// settings together may take some 1 MiB (`file_too_large`). Blocks as writing to a disk does,
  /// and up to a second for another process that writes.
  [[nodiscard]] std::optional<PlatformError> set(const std::string& key, const Value& value);
  /// The same for removing a key; one that is not there is removed.
  [[nodiscard]] std::optional<PlatformError> remove(const std::string& key);

 protected:
  /// What `maxSize` bounds is up to the system: the texts, or the file with all that it adds.
  static constexpr std::size_t maxSize = 1 << 20;

 private:
  // What a system does. It gets no other keys and texts than those that `set` takes.
  [[nodiscard]] virtual std::optional<std::string> readText(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<PlatformError> writeText(const std::string& key,
                                                               const std::string& text) = 0;
  [[nodiscard]] virtual std::optional<PlatformError> removeText(const std::string& key) = 0;
};

}  // namespace Varnel::Platform
