// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>

#include <Tests/Contract/ProcessWorlds.h>

namespace Varnel::Platform::Contract {

/// This process, as this function tells of it.
template <auto make>
class OwnProcess final : public ProcessInfoWorld {
 public:
  ProcessInfo& process() override { return *process_; }
  void setEnvironment(const std::string& name, const std::string& value) override {
    ASSERT_EQ(::setenv(name.c_str(), value.c_str(), 1), 0);
  }

 private:
  const std::unique_ptr<ProcessInfo> process_ = make();
};

/// This process's standard output, or its standard error.
template <auto make>
class Output final : public StandardOutputWorld {
 public:
  Output() {
    isError ? ::testing::internal::CaptureStderr() : ::testing::internal::CaptureStdout();
  }
  StandardOutput& output() override { return *output_; }
  std::string printed() override {
    return isError ? ::testing::internal::GetCapturedStderr()
                   : ::testing::internal::GetCapturedStdout();
  }

 private:
  static constexpr bool isError = make == &makeStandardErrorOutput;
  const std::unique_ptr<StandardOutput> output_ = make();
};

}  // namespace Varnel::Platform::Contract
