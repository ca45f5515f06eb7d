// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <thread>

#include <Tests/Load/LoadTime.h>
#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel {
namespace {

using namespace std::chrono_literals;

TEST(SharingLoad, FourProcessesShareOnePlaceHoweverTheyAreKilled) {
  const Tests::TemporaryFolder folder;
  ::setenv("XDG_RUNTIME_DIR", folder.path().c_str(), 1);
  const std::string probe = folder.path() / "probe";
  const auto start = [&](const char* turns) {
    return std::make_unique<Tests::ChildProcess>(
        std::vector<std::string>{VARNEL_SHARING_READER, turns, probe});
  };
  std::unique_ptr<Tests::ChildProcess> readers[4];
  for (auto& reader : readers) reader = start("1000000");
  std::minstd_rand random;
  int kills = 0;
  for (const auto end = Tests::endOfLoad(); std::chrono::steady_clock::now() < end; ++kills) {
    std::this_thread::sleep_for(1ms * (random() % 60));  // Any moment will do.
    auto& victim = readers[random() % 4];
    victim->signal(SIGKILL);
    EXPECT_EQ(victim->readAll(), "") << "it read beside another";
    victim->wait();
    victim = start("1000000");
  }
  for (auto& reader : readers) reader.reset();
  // What the killed have left behind keeps nobody out, and none of four the others.
  for (auto& reader : readers) reader = start("50");
  for (auto& reader : readers) EXPECT_EQ(reader->readAll(), "done\n");
  std::printf("%d kills\n", kills);
}

}  // namespace
}  // namespace Varnel
