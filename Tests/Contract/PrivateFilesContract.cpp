// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <filesystem>
#include <fstream>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;

TEST_P(PrivateFilesContract, PreparesAFileAndChangesNoneThatExists) {
  const Tests::TemporaryFolder folder;
  const std::string path = folder.path() / "new" / "folders" / "file";
  EXPECT_EQ(world->files().identity(path), std::nullopt);
  EXPECT_EQ(*world->files().prepare(path), path);
  const auto identity = world->files().identity(path);
  ASSERT_TRUE(identity);
  EXPECT_TRUE(identity->isEmpty);
  std::ofstream(path) << "bytes";
  fs::create_directory_symlink(folder.path() / "new", folder.path() / "link");
  EXPECT_EQ(*world->files().prepare(folder.path() / "link" / "folders" / "file"), path);
  EXPECT_FALSE(world->files().protect(path));
  EXPECT_EQ(*readFile(path), "bytes");
  EXPECT_EQ(world->files().identity(path), identity);
  EXPECT_FALSE(world->files().identity(path)->isEmpty);

  // Another file behind the same path is another.
  EXPECT_FALSE(world->files().rename(*world->files().prepare(path + "2"), path));
  EXPECT_EQ(*readFile(path), "");
  EXPECT_NE(world->files().identity(path), identity);
  for (int i = 0; i < 2; ++i) EXPECT_FALSE(world->files().remove(path));
  EXPECT_EQ(world->files().rename(path, path + "3"), std::errc::no_such_file_or_directory);
}

TEST_P(PrivateFilesContract, RefusesWhatIsNoFileOfTheUser) {
  const Tests::TemporaryFolder folder;
  const std::string target = folder.write("target", "bytes");
  const std::string path = folder.path() / "file";
  for (const char* suffix : {"", "-journal", "-wal", "-shm"}) {
    fs::create_symlink(target, path + suffix);
    EXPECT_EQ(world->files().prepare(path).error().domain(), privateFileRefusalDomain) << suffix;
    fs::remove(path + suffix);
    fs::create_directory(path + suffix);
    EXPECT_EQ(world->files().prepare(path).error().domain(), privateFileRefusalDomain) << suffix;
    EXPECT_TRUE(fs::remove(path + suffix));
  }
  EXPECT_FALSE(world->files().prepare(target + "/file"));
  EXPECT_FALSE(world->files().prepare(""));
  EXPECT_EQ(*readFile(target), "bytes");

  const std::string cut = target + '\0';
  const long reason = static_cast<long>(std::errc::invalid_argument);
  EXPECT_EQ(world->files().prepare(cut).error().code(), reason);
  EXPECT_EQ(world->files().tryLock(cut).error().code(), reason);
  EXPECT_EQ(world->files().identity(cut), std::nullopt);
  for (const auto& error : {world->files().protect(cut), world->files().remove(cut),
                            world->files().rename(cut, path), world->files().rename(target, cut)})
    EXPECT_EQ(error, std::errc::invalid_argument);
  EXPECT_EQ(*readFile(target), "bytes");
}

TEST_P(PrivateFilesContract, GivesALockToOneAtATime) {
  const Tests::TemporaryFolder folder;
  const std::string path = folder.path() / "new" / "lock";
  for (int i = 0; i < 2; ++i) {
    const auto lock = world->files().tryLock(path);
    ASSERT_TRUE(lock && *lock);
    const auto second = world->files().tryLock(path);
    ASSERT_TRUE(second);
    EXPECT_EQ(*second, nullptr);
    EXPECT_TRUE(*world->files().tryLock(path + "2")) << "of another file";
  }
  EXPECT_FALSE(world->files().tryLock(folder.path()));
}

// Whose files are real: a database opens them by their path.
class FakeWorld final : public PrivateFilesWorld {
 public:
  PrivateFiles& files() override { return files_; }

 private:
  Testing::FaultyPrivateFiles files_{systemPorts().privateFiles};
};
INSTANTIATE_TEST_SUITE_P(Fake, PrivateFilesContract, PrivateFilesContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
