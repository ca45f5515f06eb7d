// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainQueueContract.h>
#include <Varnel/Platform/Bare/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class BareWorld final : public MainQueueWorld {
 public:
  MainQueue& queue() override { return *queue_; }

 private:
  const std::unique_ptr<MainQueue> queue_ = Bare::makeMainQueue();
};

INSTANTIATE_TEST_SUITE_P(Bare, MainQueueContract, MainQueueContract::on<BareWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
