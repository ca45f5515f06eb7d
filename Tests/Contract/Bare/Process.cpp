// SPDX-License-Identifier: MIT
#include <cstdlib>

#include <Tests/Contract/ProcessWorlds.h>
#include <Varnel/Platform/Bare/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class LinkedProgram final : public ProcessInfoWorld {
 public:
  ProcessInfo& process() override { return *process_; }
  void setEnvironment(const std::string& name, const std::string& value) override {
    ASSERT_EQ(::setenv(name.c_str(), value.c_str(), 1), 0);
  }

 private:
  const std::unique_ptr<ProcessInfo> process_ = Bare::makeProcessInfo();
};
INSTANTIATE_TEST_SUITE_P(Bare, ProcessInfoContract, ProcessInfoContract::on<LinkedProgram>());

class Output final : public StandardOutputWorld {
 public:
  Output() { ::testing::internal::CaptureStdout(); }
  StandardOutput& output() override { return *output_; }
  std::string printed() override { return ::testing::internal::GetCapturedStdout(); }

 private:
  const std::unique_ptr<StandardOutput> output_ = Bare::makeStandardOutput();
};
INSTANTIATE_TEST_SUITE_P(Bare, StandardOutputContract, StandardOutputContract::on<Output>());

class ErrorOutput final : public StandardOutputWorld {
 public:
  ErrorOutput() { ::testing::internal::CaptureStderr(); }
  StandardOutput& output() override { return *output_; }
  std::string printed() override { return ::testing::internal::GetCapturedStderr(); }

 private:
  const std::unique_ptr<StandardOutput> output_ = makeStandardErrorOutput();
};
INSTANTIATE_TEST_SUITE_P(BareErrors, StandardOutputContract,
                         StandardOutputContract::on<ErrorOutput>());

}  // namespace
}  // namespace Varnel::Platform::Contract
