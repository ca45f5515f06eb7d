// SPDX-License-Identifier: MIT
#include <Tests/Contract/AppendFilesContract.h>
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

}  // namespace
}  // namespace Varnel::Platform::Contract
