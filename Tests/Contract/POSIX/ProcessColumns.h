// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>

#include <Tests/Contract/ProcessWorlds.h>

namespace Varnel::Platform::Contract {

/// This process, as this function tells of it.
template <auto make>
class OwnProcess final : public AdapterColumn<ProcessInfoWorld, make> {
 public:
  void setEnvironment(const std::string& name, const std::string& value) override {
    ASSERT_EQ(::setenv(name.c_str(), value.c_str(), 1), 0);
  }
};

/// This process's standard output, or its standard error.
template <auto make>
class Output final : public AdapterColumn<StandardOutputWorld, make> {
 public:
  Output() {
    isError ? ::testing::internal::CaptureStderr() : ::testing::internal::CaptureStdout();
  }
  std::string printed() override {
    return isError ? ::testing::internal::GetCapturedStderr()
                   : ::testing::internal::GetCapturedStdout();
  }

 private:
  const bool isError = make == &makeStandardErrorOutput;
};

}  // namespace Varnel::Platform::Contract
