// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <thread>

#include <Varnel/Platform/Testing/FakeReadingPriority.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(ReadingPriorityContract, IsTheThreadsOwnAndCanBeRestored) {
  ReadingPriority& priority = world->priority();
  const auto normal = priority.current();
  ASSERT_TRUE(normal);
  EXPECT_EQ(priority.ofMainThread(), normal);
  std::thread([&] {
    const auto lowered = priority.lowered(*normal);
    EXPECT_NE(lowered, *normal);
    EXPECT_EQ(priority.lowered(lowered), lowered);
    for (int i = 0; i < 2; ++i) {
      priority.set(lowered);
      EXPECT_EQ(priority.current(), lowered);
      EXPECT_EQ(priority.ofMainThread(), normal);
      priority.set(*normal);
      EXPECT_EQ(priority.current(), normal);
    }
    priority.set(lowered);
  }).join();
  EXPECT_EQ(priority.current(), normal);
  std::thread([&] { EXPECT_EQ(priority.current(), normal); }).join();
}

class FakeWorld final : public ReadingPriorityWorld {
 public:
  ReadingPriority& priority() override { return priority_; }

 private:
  Testing::FakeReadingPriority priority_;
};
INSTANTIATE_TEST_SUITE_P(Fake, ReadingPriorityContract, ReadingPriorityContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
