// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel::Platform::Contract {
namespace {

class OpenFiles final : public AdapterColumn<AppendFilesWorld, POSIX::makeAppendFiles> {
 public:
  std::string obstacle() const override {
    return std::filesystem::exists(full) ? "" : "no device that is full";
  }
  std::string path() override { return folder_.path() / "log"; }
  std::string text() override { return readFile(path()).valueOr(""); }
  std::string pathOnAFullDisk() override { return full; }
  std::string pathInNoFolder() override { return folder_.path() / "missing" / "log"; }

 private:
  static constexpr const char* full = "/dev/full";
  const Tests::TemporaryFolder folder_;
};
INSTANTIATE_TEST_SUITE_P(POSIX, AppendFilesContract, on<OpenFiles>());

using OwnFiles = AdapterColumn<WorldOf<PrivateFiles>, POSIX::makePrivateFiles>;
INSTANTIATE_TEST_SUITE_P(POSIX, PrivateFilesContract, on<OwnFiles>());

class FileRights final : public AdapterColumn<SecurityScopeWorld, POSIX::makeSecurityScope> {
 public:
  URL readable(bool isFolder) override {
    return URL::fileURLWithPath(isFolder ? folder_.path().string() + "/"
                                         : folder_.write("file", "").string());
  }
  URL forbidden() override { return URL::fileURLWithPath((folder_.path() / "missing").string()); }

 private:
  const Tests::TemporaryFolder folder_;
};
INSTANTIATE_TEST_SUITE_P(POSIX, SecurityScopeContract, on<FileRights>());

}  // namespace
}  // namespace Varnel::Platform::Contract
