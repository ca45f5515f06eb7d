// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainQueueContract.h>
#include <Varnel/Platform/Generic/WatchedMainQueue.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform::Contract {
namespace {

class WatchedWorld final : public MainQueueWorld {
 public:
  MainQueue& queue() override { return queue_; }

 private:
  // The watch may outlast the test by a moment.
  static inline Testing::CapturedSystemLog log_;
  WatchedMainQueue queue_{std::make_unique<Testing::FakeMainQueue>(), log_};
};

INSTANTIATE_TEST_SUITE_P(Watched, MainQueueContract, MainQueueContract::on<WatchedWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
