// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The application's settings of this user, kept from run to run. Any thread.
///
///     defaults.set("scans", std::int64_t{3});
///     defaults.integer("scans").value_or(0);
class VARNEL_API UserDefaults {
 public:
  using Value = std::variant<bool, std::int64_t, double, std::string>;

  virtual ~UserDefaults() = default;

  /// The value under a key; absent when there is none, or when it cannot be read as this type.
  [[nodiscard]] virtual std::optional<bool> truthValue(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<std::int64_t> integer(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<double> real(const std::string& key) const = 0;
  [[nodiscard]] virtual std::optional<std::string> text(const std::string& key) const = 0;

  /// Keeps a value under a key, in memory and on disk. If the disk refuses it, the value lasts as
  /// long as the process.
  virtual void set(const std::string& key, const Value& value) = 0;
  virtual void remove(const std::string& key) = 0;
};

}  // namespace Varnel::Platform
