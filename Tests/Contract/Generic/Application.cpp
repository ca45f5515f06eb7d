// SPDX-License-Identifier: MIT
#include <Tests/Contract/ApplicationContract.h>
#include <Varnel/Platform/Generic/HostedApplication.h>

namespace Varnel::Platform::Contract {
namespace {

class HostedWorld final : public ApplicationWorld {
 public:
  Application& application() override { return application_; }

 private:
  HostedApplication application_;
};

INSTANTIATE_TEST_SUITE_P(Hosted, ApplicationContract, ApplicationContract::on<HostedWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
