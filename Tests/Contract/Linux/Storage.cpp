// SPDX-License-Identifier: MIT
#include <sys/xattr.h>

#include <Tests/Contract/FilesWorlds.h>
#include <Tests/Contract/POSIX/UserFolders.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

// The file is reached by a link, which is followed.
class UserAttributes final
    : public AdapterColumn<ExtendedAttributesWorld, Linux::makeExtendedAttributes> {
 public:
  UserAttributes() { std::filesystem::create_symlink(file_, path()); }
  std::string obstacle() const override {
    return ::setxattr(file_.c_str(), "user.probe", "", 0, 0) == 0
               ? ""
               : "The file system of " + file_ + " keeps no attributes.";
  }
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
};
INSTANTIATE_TEST_SUITE_P(Linux, ExtendedAttributesContract, on<UserAttributes>());

INSTANTIATE_TEST_SUITE_P(Linux, UserDefaultsContract,
                         on<UserFolders<Linux::makeApplicationStorage>>());

}  // namespace
}  // namespace Varnel::Platform::Contract
