// SPDX-License-Identifier: MIT
#include <sys/xattr.h>

#include <cstdlib>

#include <Tests/Contract/FilesWorlds.h>
#include <Tests/Contract/POSIX/UserFolders.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

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

class HomeTrash final : public TrashWorld {
 public:
  HomeTrash() { ::setenv("XDG_DATA_HOME", (home_.path() / "data").c_str(), 1); }
  Trash& port() override { return *trash_; }
  std::string folder() override { return home_.path() / "files"; }
  void write(const std::string& path, std::size_t size) override {
    home_.write(path, std::string(size, 'x'));
  }
  bool exists(const std::string& path) override {
    return std::filesystem::exists(std::filesystem::symlink_status(path));
  }
  void remove(const std::string& folder) override { std::filesystem::remove_all(folder); }
  void empty(const TrashedFile& file) override {
    std::filesystem::remove(file.folder + "/info/" + file.name + ".trashinfo");
    std::filesystem::remove(file.folder + "/files/" + file.name);
  }
  std::string pathWithoutTrash() override { return "/proc/uptime"; }

 private:
  const Tests::TemporaryFolder home_ = Tests::TemporaryFolder::inMemory();
  const std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
  Testing::SimulatedClock clock_;
  Testing::FakeTimeZones zones_;
  const std::unique_ptr<Trash> trash_ = Linux::makeTrash(*files_, clock_, zones_);
};
INSTANTIATE_TEST_SUITE_P(Linux, TrashContract, on<HomeTrash>());

INSTANTIATE_TEST_SUITE_P(Linux, UserDefaultsContract,
                         on<UserFolders<Linux::makeApplicationStorage>>());

}  // namespace
}  // namespace Varnel::Platform::Contract
