// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <mutex>
#include <string>
#include <utility>

#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Testing/FakeUserDefaults.h>
#include <Varnel/Platform/Values/PathComponents.h>

namespace Varnel::Platform::Testing {

/// Settings in memory and files below a folder of the test, by identifier. Any thread.
///
///     FakeApplicationStorage storage(temporaryFolder);
///     storage.userDefaults("com.example.Fotovia").integer("scans").value_or(0);
class FakeApplicationStorage final : public ApplicationStorage {
 public:
  explicit FakeApplicationStorage(std::string folder) : folder_(std::move(folder)) {}

  [[nodiscard]] FakeUserDefaults& userDefaults(const std::string& identifier) override {
    const std::lock_guard lock(mutex_);
    return userDefaults_[identifier];
  }
  [[nodiscard]] std::string settingsPath(const std::string& identifier) const override {
    return folder_ + '/' + fileNameFor(identifier) + "/settings";
  }
  [[nodiscard]] std::string analyticsSpoolPath(const std::string& identifier) const override {
    return folder_ + '/' + fileNameFor(identifier) + "/analytics.sqlite";
  }

 private:
  const std::string folder_;
  std::mutex mutex_;  ///< Owns `userDefaults_`.
  std::map<std::string, FakeUserDefaults> userDefaults_;
};

}  // namespace Varnel::Platform::Testing
