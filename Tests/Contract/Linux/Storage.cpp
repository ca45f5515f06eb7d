// SPDX-License-Identifier: MIT
#include <sys/xattr.h>

#include <cstdlib>

#include <Tests/Contract/FilesWorlds.h>
#include <Tests/Contract/UserDefaultsContract.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

// The file is reached by a link, which is followed.
class UserAttributes final : public ExtendedAttributesWorld {
 public:
  UserAttributes() { std::filesystem::create_symlink(file_, path()); }
  std::string obstacle() const override {
    return ::setxattr(file_.c_str(), "user.probe", "", 0, 0) == 0
               ? ""
               : "The file system of " + file_ + " keeps no attributes.";
  }
  ExtendedAttributes& attributes() override { return *attributes_; }
  std::string path() override { return folder_.path() / "link"; }
  void set(const std::string& name, const std::string& value) override {
    ASSERT_EQ(::setxattr(file_.c_str(), ("user." + name).c_str(), value.data(), value.size(), 0),
              0);
  }
  std::string missingPath() override { return folder_.path() / "missing"; }
  std::string pathWithoutAttributes() override { return "/proc/self/stat"; }

 private:
  const Tests::TemporaryFolder folder_;
  const std::string file_ = folder_.write("file", "");
  const std::unique_ptr<ExtendedAttributes> attributes_ = Linux::makeExtendedAttributes();
};
INSTANTIATE_TEST_SUITE_P(Linux, ExtendedAttributesContract,
                         ExtendedAttributesContract::on<UserAttributes>());

class UserFolders final : public UserDefaultsWorld {
 public:
  UserFolders() {
    for (const char* variable : {"XDG_CONFIG_HOME", "XDG_STATE_HOME"})
      ::setenv(variable, home_.path().c_str(), 1);
  }
  ApplicationStorage& storage() override { return *storage_; }
  ApplicationStorage& storageOfAnother() override { return *another_; }

 private:
  const Tests::TemporaryFolder home_ = Tests::TemporaryFolder::inMemory();
  Testing::CapturedSystemLog log_;
  const std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
  const std::unique_ptr<ApplicationStorage> storage_ = Linux::makeApplicationStorage(*files_, log_);
  const std::unique_ptr<ApplicationStorage> another_ = Linux::makeApplicationStorage(*files_, log_);
};
INSTANTIATE_TEST_SUITE_P(Linux, UserDefaultsContract, UserDefaultsContract::on<UserFolders>());

}  // namespace
}  // namespace Varnel::Platform::Contract
