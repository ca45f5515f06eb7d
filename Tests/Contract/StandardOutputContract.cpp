// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <map>
#include <sstream>
#include <thread>

#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(StandardOutputContract, PrintsTextsAsTheyAre) {
  std::string expected;
  for (const std::string& text : {"a"s, ""s, "100 %s\r\n"s, "\0\xFF"s, std::string(1 << 20, 'x')}) {
    world->output().print(text);
    expected += text;
  }
  EXPECT_TRUE(world->printed() == expected);
}

TEST_P(StandardOutputContract, NeverMixesTextsOfThreadsAndKeepsTheOrderOfEach) {
  constexpr int count = 1000;
  const auto print = [&](char name) {
    for (int i = 0; i < count; ++i)
      world->output().print(std::string(100, name) + ' ' + std::to_string(i) + '\n');
  };
  {
    std::jthread one(print, 'a');
    std::jthread other(print, 'b');
  }
  std::map<std::string, int> next;
  std::istringstream lines(world->printed());
  int number = 0;
  for (std::string name; lines >> name >> number;) EXPECT_EQ(number, next[name]++);
  EXPECT_EQ(next, (std::map<std::string, int>{{std::string(100, 'a'), count},
                                              {std::string(100, 'b'), count}}));
}

class FakeWorld final : public StandardOutputWorld {
 public:
  StandardOutput& output() override { return output_; }
  std::string printed() override { return output_.text(); }

 private:
  Testing::CapturedOutput output_;
};
INSTANTIATE_TEST_SUITE_P(Fake, StandardOutputContract, StandardOutputContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
