// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Settings that last as long as the object. Any thread.
class FakeUserDefaults final : public UserDefaults {
 public:
  /// A reading that goes wrong finds nothing; a change is refused.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

 private:
  [[nodiscard]] std::optional<std::string> readText(const std::string& key) const override {
    if (faults->strikes()) return std::nullopt;
    const std::lock_guard lock(mutex_);
    const auto found = texts_.find(key);
    if (found == texts_.end()) return std::nullopt;
    return found->second;
  }
  [[nodiscard]] std::optional<PlatformError> writeText(const std::string& key,
                                                       const std::string& text) override {
    if (faults->strikes()) return failure(std::errc::io_error);
    const std::lock_guard lock(mutex_);
    std::size_t size = key.size() + text.size();
    for (const auto& [other, kept] : texts_)
      if (other != key) size += other.size() + kept.size();
    if (size > maxSize) return failure(std::errc::file_too_large);
    texts_[key] = text;
    return std::nullopt;
  }
  [[nodiscard]] std::optional<PlatformError> removeText(const std::string& key) override {
    if (faults->strikes()) return failure(std::errc::io_error);
    const std::lock_guard lock(mutex_);
    texts_.erase(key);
    return std::nullopt;
  }

  static PlatformError failure(std::errc reason) {
    return PlatformError(std::make_error_code(reason));
  }

  mutable std::mutex mutex_;  ///< Owns `texts_`.
  std::map<std::string, std::string> texts_;
};

}  // namespace Varnel::Platform::Testing
