// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ApplicationStorage.h>

#include <map>
#include <memory>
#include <mutex>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/KeyFileDefaults.h>
#include <Varnel/Platform/Linux/Process/UserFolders.h>

namespace Varnel::Platform::Linux {
namespace {

class UserFoldersStorage final : public ApplicationStorage {
 public:
  UserFoldersStorage(PrivateFiles& files, SystemLog& systemLog)
      : files_(files), systemLog_(systemLog) {}

  UserDefaults& userDefaults(const std::string& identifier) override {
    const std::lock_guard lock(mutex_);
    auto& defaults = defaults_[identifier];
    if (!defaults)
      defaults =
          std::make_unique<KeyFileDefaults>(files_, systemLog_, settingsFile(identifier).string());
    return *defaults;
  }

  std::string analyticsSpoolPath(const std::string& identifier) const override {
    return analyticsSpool(identifier).string();
  }

 private:
  PrivateFiles& files_;
  SystemLog& systemLog_;
  std::mutex mutex_;  ///< Owns `defaults_`.
  std::map<std::string, std::unique_ptr<KeyFileDefaults>> defaults_;
};

}  // namespace

std::unique_ptr<ApplicationStorage> makeApplicationStorage(PrivateFiles& files,
                                                           SystemLog& systemLog) {
  return std::make_unique<UserFoldersStorage>(files, systemLog);
}

}  // namespace Varnel::Platform::Linux
