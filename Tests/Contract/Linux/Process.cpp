// SPDX-License-Identifier: MIT
#include <Tests/Contract/POSIX/ProcessColumns.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class SpawnedPrograms final
    : public AdapterColumn<ProcessLauncherWorld, Linux::makeProcessLauncher> {
 public:
  Program thatPrints(const std::string& text) override {
    return {"/bin/cat", {folder_.write("text", text)}};
  }
  // For its input, which stays open.
  Program thatWaits() override { return {"/bin/cat", {}}; }
  Program thatDoesNotExist() override { return {folder_.path() / "missing", {}}; }

 private:
  const Tests::TemporaryFolder folder_;
};
INSTANTIATE_TEST_SUITE_P(Linux, ProcessLauncherContract, on<SpawnedPrograms>());

using ThreadPriority = AdapterColumn<WorldOf<ReadingPriority>, Linux::makeReadingPriority>;
INSTANTIATE_TEST_SUITE_P(Linux, ReadingPriorityContract, on<ThreadPriority>());

std::unique_ptr<ProcessInfo> makeProcess() {
  return Linux::makeProcessInfo();
}
INSTANTIATE_TEST_SUITE_P(Linux, ProcessInfoContract, on<OwnProcess<makeProcess>>());
INSTANTIATE_TEST_SUITE_P(Linux, StandardOutputContract, on<Output<Linux::makeStandardOutput>>());
INSTANTIATE_TEST_SUITE_P(LinuxErrors, StandardOutputContract,
                         on<Output<makeStandardErrorOutput>>());

}  // namespace
}  // namespace Varnel::Platform::Contract
