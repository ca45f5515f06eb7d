// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <thread>

#include <Varnel/Platform/Testing/FakeProcessLauncher.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(ProcessLauncherContract, GivesAllThatAProgramHasPrintedOnce) {
  for (const std::string& text : {""s, "\0\xFF\n"s, std::string(60'000, 'x')}) {
    const auto [path, arguments] = world->thatPrints(text);
    const auto process = world->launcher().launch(path, arguments);
    ASSERT_TRUE(process);
    while ((*process)->isRunning()) std::this_thread::yield();
    (*process)->terminate();
    EXPECT_FALSE((*process)->isRunning());
    EXPECT_EQ((*process)->readOutput(), text);
    EXPECT_EQ((*process)->readOutput(), "");
  }
}

TEST_P(ProcessLauncherContract, EndsAProgramThatRuns) {
  const auto [path, arguments] = world->thatWaits();
  const auto process = world->launcher().launch(path, arguments);
  ASSERT_TRUE(process);
  for (int i = 0; i < 100; ++i) EXPECT_TRUE((*process)->isRunning());
  EXPECT_EQ((*process)->readOutput(), "");
  for (int i = 0; i < 2; ++i) {
    (*process)->terminate();
    EXPECT_FALSE((*process)->isRunning());
  }
  EXPECT_EQ((*process)->readOutput(), "");
  EXPECT_TRUE(world->launcher().launch(path, arguments)) << "and this one goes with its object";
}

TEST_P(ProcessLauncherContract, TellsWhyAProgramCannotBeLaunched) {
  const auto launch = [&](const std::string& path, const std::vector<std::string>& arguments) {
    return world->launcher().launch(path, arguments).error();
  };
  const auto [path, arguments] = world->thatPrints("text");
  EXPECT_EQ(launch(path + '\0', arguments), std::errc::invalid_argument);
  EXPECT_EQ(launch(path, {"-c\0"s}), std::errc::invalid_argument);
  const auto missing = world->thatDoesNotExist();
  EXPECT_EQ(launch(missing.path, {}), std::errc::no_such_file_or_directory);
}

class FakeWorld final : public ProcessLauncherWorld {
 public:
  ProcessLauncher& launcher() override { return launcher_; }
  Program thatPrints(const std::string& text) override {
    launcher_.script = {.output = text, .questions = 3};
    return {"/tool", {}};
  }
  Program thatWaits() override {
    launcher_.script = {.questions = -1};
    return {"/tool", {}};
  }
  Program thatDoesNotExist() override {
    launcher_.script.launchError = std::make_error_code(std::errc::no_such_file_or_directory);
    return {"/missing", {}};
  }

 private:
  Testing::FakeProcessLauncher launcher_;
};
INSTANTIATE_TEST_SUITE_P(Fake, ProcessLauncherContract, ProcessLauncherContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
