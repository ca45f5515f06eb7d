// SPDX-License-Identifier: MIT
#include <cstdlib>

#include <Tests/Contract/ProcessInfoContract.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class ProcFolder final : public ProcessInfoWorld {
 public:
  ProcessInfo& process() override { return *process_; }
  void setEnvironment(const std::string& name, const std::string& value) override {
    ASSERT_EQ(::setenv(name.c_str(), value.c_str(), 1), 0);
  }

 private:
  const std::unique_ptr<ProcessInfo> process_ = Linux::makeProcessInfo();
};
INSTANTIATE_TEST_SUITE_P(Linux, ProcessInfoContract, ProcessInfoContract::on<ProcFolder>());

}  // namespace
}  // namespace Varnel::Platform::Contract
