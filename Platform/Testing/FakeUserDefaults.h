// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Settings that last as long as the object. A value reads as the type that it was set with, and
/// as no other. Any thread.
class FakeUserDefaults final : public UserDefaults {
 public:
  /// A reading that goes wrong finds nothing; a change is refused.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  [[nodiscard]] std::optional<bool> truthValue(const std::string& key) const override {
    return read<bool>(key);
  }
  [[nodiscard]] std::optional<std::int64_t> integer(const std::string& key) const override {
    return read<std::int64_t>(key);
  }
  [[nodiscard]] std::optional<double> real(const std::string& key) const override {
    return read<double>(key);
  }
  [[nodiscard]] std::optional<std::string> text(const std::string& key) const override {
    return read<std::string>(key);
  }
  [[nodiscard]] std::optional<PlatformError> set(const std::string& key,
                                                 const Value& value) override {
    if (faults->strikes()) return failure();
    const std::lock_guard lock(mutex_);
    values_[key] = value;
    return std::nullopt;
  }
  [[nodiscard]] std::optional<PlatformError> remove(const std::string& key) override {
    if (faults->strikes()) return failure();
    const std::lock_guard lock(mutex_);
    values_.erase(key);
    return std::nullopt;
  }

 private:
  static PlatformError failure() {
    return PlatformError(std::make_error_code(std::errc::io_error));
  }

  template <typename Type>
  std::optional<Type> read(const std::string& key) const {
    if (faults->strikes()) return std::nullopt;
    const std::lock_guard lock(mutex_);
    const auto found = values_.find(key);
    const auto* value = found == values_.end() ? nullptr : std::get_if<Type>(&found->second);
    if (!value) return std::nullopt;
    return *value;
  }

  mutable std::mutex mutex_;  ///< Owns `values_`.
  std::map<std::string, Value> values_;
};

}  // namespace Varnel::Platform::Testing
