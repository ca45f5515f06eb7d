// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <Varnel/Platform/Testing/FakeAppendFiles.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(AppendFilesContract, AppendsEachTextAtTheEndWhereverThatIs) {
  const auto one = world->files().open(world->path());
  const auto other = world->files().open(world->path());
  ASSERT_TRUE(one && other);
  EXPECT_EQ(world->text(), "");
  std::string expected;
  for (const std::string& bytes : {"a"s, ""s, "two\r\n"s, "\0\xFF"s, std::string(1 << 20, 'x')}) {
    for (const auto* file : {&one, &other}) {
      EXPECT_FALSE((**file)->append(bytes));
      expected += bytes;
    }
    EXPECT_EQ(world->text(), expected);
  }
  EXPECT_FALSE((**world->files().open(world->path())).append("later"));
  EXPECT_TRUE(world->text().ends_with("later"));
}

TEST_P(AppendFilesContract, TellsWhyNothingIsWritten) {
  EXPECT_EQ(world->files().open(world->path() + '\0').error(), std::errc::invalid_argument);
  const auto full = world->files().open(world->pathOnAFullDisk());
  ASSERT_TRUE(full);
  for (int i = 0; i < 2; ++i) EXPECT_EQ((*full)->append("bytes"), std::errc::no_space_on_device);
  EXPECT_EQ(world->files().open(world->pathInNoFolder()).error(),
            std::errc::no_such_file_or_directory);
  EXPECT_EQ(world->text(), "");
}

class FakeWorld final : public AppendFilesWorld {
 public:
  AppendFiles& files() override { return files_; }
  std::string path() override { return "/log"; }
  std::string text() override { return files_.text(path()); }
  std::string pathOnAFullDisk() override {
    files_.failure = std::errc::no_space_on_device;
    files_.faults->plan(Testing::Fault::fails, files_.faults->calls() + 2);
    return "/full";
  }
  std::string pathInNoFolder() override {
    files_.faults->plan(Testing::Fault::absent, 1);
    return "/missing/log";
  }

 private:
  Testing::FakeAppendFiles files_;
};
INSTANTIATE_TEST_SUITE_P(Fake, AppendFilesContract, AppendFilesContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
