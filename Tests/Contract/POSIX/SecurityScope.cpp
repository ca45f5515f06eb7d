// SPDX-License-Identifier: MIT
#include <Tests/Contract/SecurityScopeContract.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

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
