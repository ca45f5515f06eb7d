// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainQueueContract.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class LinuxWorld final : public MainQueueWorld {
 public:
  MainQueue& queue() override { return *queue_; }

 private:
  const std::unique_ptr<MainQueue> queue_ = Linux::makeMainQueue();
};

INSTANTIATE_TEST_SUITE_P(Linux, MainQueueContract, MainQueueContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
