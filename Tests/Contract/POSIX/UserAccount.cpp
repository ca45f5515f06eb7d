// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserAccountContract.h>

#include <stdlib.h>

#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class POSIXWorld final : public UserAccountWorld {
 public:
  UserAccount& account() override { return *account_; }
  void moveHome(const std::string& path) override { ::setenv("HOME", path.c_str(), 1); }

 private:
  const std::unique_ptr<UserAccount> account_ = POSIX::makeUserAccount();
};

INSTANTIATE_TEST_SUITE_P(POSIX, UserAccountContract, UserAccountContract::on<POSIXWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
