// SPDX-License-Identifier: MIT
#include <cstdlib>

#include <Tests/Contract/ProcessWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
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

class SpawnedPrograms final : public ProcessLauncherWorld {
 public:
  ProcessLauncher& launcher() override { return *launcher_; }
  Program thatPrints(const std::string& text) override {
    return {"/bin/cat", {folder_.write("text", text)}};
  }
  // For its input, which stays open.
  Program thatWaits() override { return {"/bin/cat", {}}; }
  Program thatDoesNotExist() override { return {folder_.path() / "missing", {}}; }

 private:
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<ProcessLauncher> launcher_ = Linux::makeProcessLauncher();
};
INSTANTIATE_TEST_SUITE_P(Linux, ProcessLauncherContract,
                         ProcessLauncherContract::on<SpawnedPrograms>());

class ThreadPriority final : public ReadingPriorityWorld {
 public:
  ReadingPriority& priority() override { return *priority_; }

 private:
  const std::unique_ptr<ReadingPriority> priority_ = Linux::makeReadingPriority();
};
INSTANTIATE_TEST_SUITE_P(Linux, ReadingPriorityContract,
                         ReadingPriorityContract::on<ThreadPriority>());

class Output final : public StandardOutputWorld {
 public:
  Output() { ::testing::internal::CaptureStdout(); }
  StandardOutput& output() override { return *output_; }
  std::string printed() override { return ::testing::internal::GetCapturedStdout(); }

 private:
  const std::unique_ptr<StandardOutput> output_ = Linux::makeStandardOutput();
};
INSTANTIATE_TEST_SUITE_P(Linux, StandardOutputContract, StandardOutputContract::on<Output>());

class ErrorOutput final : public StandardOutputWorld {
 public:
  ErrorOutput() { ::testing::internal::CaptureStderr(); }
  StandardOutput& output() override { return *output_; }
  std::string printed() override { return ::testing::internal::GetCapturedStderr(); }

 private:
  const std::unique_ptr<StandardOutput> output_ = makeStandardErrorOutput();
};
INSTANTIATE_TEST_SUITE_P(LinuxErrors, StandardOutputContract,
                         StandardOutputContract::on<ErrorOutput>());

}  // namespace
}  // namespace Varnel::Platform::Contract
