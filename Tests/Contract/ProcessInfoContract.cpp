// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <Varnel/Platform/Testing/FakeProcessInfo.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(ProcessInfoContract, KnowsItsSystemAndTellsAnEmptyVariableFromNone) {
  world->setEnvironment("VARNEL_A", "B=C");
  world->setEnvironment("VARNEL_EMPTY", "");
  const ProcessInfo& process = world->process();
  EXPECT_GT(process.operatingSystemVersion().major, 0);
  EXPECT_TRUE(process.executablePath().starts_with('/'));
  EXPECT_EQ(process.environmentVariable("VARNEL_A"), "B=C");
  EXPECT_EQ(process.environmentVariable("VARNEL_EMPTY"), "");
  for (const std::string& name : {"VARNEL_"s, "VARNEL_a"s, "VARNEL_A=B"s, "VARNEL_A\0"s, ""s})
    EXPECT_EQ(process.environmentVariable(name), std::nullopt) << name;
}

class FakeWorld final : public ProcessInfoWorld {
 public:
  ProcessInfo& process() override { return process_; }
  void setEnvironment(const std::string& name, const std::string& value) override {
    process_.environment[name] = value;
  }

 private:
  Testing::FakeProcessInfo process_;
};
INSTANTIATE_TEST_SUITE_P(Fake, ProcessInfoContract, ProcessInfoContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
