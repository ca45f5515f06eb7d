// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>

#include <Tests/Contract/UserWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {

/// Storage in the folders of the desktop's base-directory standard, as this function makes it.
template <auto make>
class UserFolders final : public UserDefaultsWorld {
 public:
  UserFolders() {
    for (const char* variable : {"XDG_CONFIG_HOME", "XDG_STATE_HOME"})
      ::setenv(variable, home_.path().c_str(), 1);
  }
  ApplicationStorage& port() override { return *storage_; }
  ApplicationStorage& storageOfAnother() override { return *another_; }

 private:
  const Tests::TemporaryFolder home_ = Tests::TemporaryFolder::inMemory();
  Testing::CapturedSystemLog log_;
  const std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
  const std::unique_ptr<ApplicationStorage> storage_ = make(*files_, log_);
  const std::unique_ptr<ApplicationStorage> another_ = make(*files_, log_);
};

}  // namespace Varnel::Platform::Contract
