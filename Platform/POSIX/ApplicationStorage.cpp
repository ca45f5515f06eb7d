// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ApplicationStorage.h>

#include <map>
#include <memory>
#include <mutex>
#include <utility>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/UserDefaults.h>

namespace Varnel::Platform::POSIX {
namespace {

class UserFoldersStorage final : public ApplicationStorage {
 public:
  UserFoldersStorage(std::string settingsName, MakeDefaults makeDefaults)
      : settingsName_(std::move(settingsName)), makeDefaults_(std::move(makeDefaults)) {}

  UserDefaults& userDefaults(const std::string& identifier) override {
    const std::lock_guard lock(mutex_);
    auto& defaults = defaults_[identifier];
    if (!defaults) defaults = makeDefaults_(settingsPath(identifier));
    return *defaults;
  }

  std::string settingsPath(const std::string& identifier) const override {
    return (settingsFolder(identifier) / settingsName_).string();
  }

  std::string analyticsSpoolPath(const std::string& identifier) const override {
    return analyticsSpool(identifier).string();
  }

 private:
  const std::string settingsName_;
  const MakeDefaults makeDefaults_;
  std::mutex mutex_;  ///< Owns `defaults_`.
  std::map<std::string, std::unique_ptr<UserDefaults>> defaults_;
};

}  // namespace

std::unique_ptr<ApplicationStorage> makeApplicationStorage(std::string settingsName,
                                                           MakeDefaults makeDefaults) {
  return std::make_unique<UserFoldersStorage>(std::move(settingsName), std::move(makeDefaults));
}

}  // namespace Varnel::Platform::POSIX
