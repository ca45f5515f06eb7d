// SPDX-License-Identifier: MIT
#include <Tests/Contract/ReadingPriorityContract.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class ThreadPriority final : public ReadingPriorityWorld {
 public:
  ReadingPriority& priority() override { return *priority_; }

 private:
  const std::unique_ptr<ReadingPriority> priority_ = Linux::makeReadingPriority();
};
INSTANTIATE_TEST_SUITE_P(Linux, ReadingPriorityContract,
                         ReadingPriorityContract::on<ThreadPriority>());

}  // namespace
}  // namespace Varnel::Platform::Contract
