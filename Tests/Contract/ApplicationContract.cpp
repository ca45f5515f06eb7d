// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <thread>

#include <Varnel/Platform/Testing/FakeApplication.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(ApplicationContract, IsInFrontWhenTheHostSaysSoOnWhateverThread) {
  auto& application = world->application();
  EXPECT_FALSE(application.isActive());
  for (const bool isActive : {true, true, false, false}) {
    std::jthread([&] { application.setActive(isActive); }).join();
    EXPECT_EQ(application.isActive(), isActive);
  }
}

class FakeWorld final : public ApplicationWorld {
 public:
  Application& application() override { return application_; }

 private:
  Testing::FakeApplication application_;
};

INSTANTIATE_TEST_SUITE_P(Fake, ApplicationContract, ApplicationContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
