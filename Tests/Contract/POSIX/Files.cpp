// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel::Platform::Contract {
namespace {

class OpenFiles final : public AppendFilesWorld {
 public:
  std::string obstacle() const override {
    return std::filesystem::exists(full) ? "" : "no device that is full";
  }
  AppendFiles& files() override { return *files_; }
  std::string path() override { return folder_.path() / "log"; }
  std::string text() override { return readFile(path()).valueOr(""); }
  std::string pathOnAFullDisk() override { return full; }
  std::string pathInNoFolder() override { return folder_.path() / "missing" / "log"; }

 private:
  static constexpr const char* full = "/dev/full";
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<AppendFiles> files_ = POSIX::makeAppendFiles();
};
INSTANTIATE_TEST_SUITE_P(POSIX, AppendFilesContract, AppendFilesContract::on<OpenFiles>());

class OwnFiles final : public PrivateFilesWorld {
 public:
  PrivateFiles& files() override { return *files_; }

 private:
  const std::unique_ptr<PrivateFiles> files_ = POSIX::makePrivateFiles();
};
INSTANTIATE_TEST_SUITE_P(POSIX, PrivateFilesContract, PrivateFilesContract::on<OwnFiles>());

class FileRights final : public SecurityScopeWorld {
 public:
  SecurityScope& scope() override { return *scope_; }
  URL readable(bool isFolder) override {
    return URL::fileURLWithPath(isFolder ? folder_.path().string() + "/"
                                         : folder_.write("file", "").string());
  }
  URL forbidden() override { return URL::fileURLWithPath((folder_.path() / "missing").string()); }

 private:
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<SecurityScope> scope_ = POSIX::makeSecurityScope();
};
INSTANTIATE_TEST_SUITE_P(POSIX, SecurityScopeContract, SecurityScopeContract::on<FileRights>());

}  // namespace
}  // namespace Varnel::Platform::Contract
