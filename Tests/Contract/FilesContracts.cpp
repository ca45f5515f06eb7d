// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <filesystem>
#include <fstream>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Testing/FakeAppendFiles.h>
#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

TEST_P(AppendFilesContract, AppendsEachTextAtTheEndWhereverThatIs) {
  const auto one = world->port().open(world->path());
  const auto other = world->port().open(world->path());
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
  EXPECT_FALSE((**world->port().open(world->path())).append("later"));
  EXPECT_TRUE(world->text().ends_with("later"));
}

TEST_P(AppendFilesContract, TellsWhyNothingIsWritten) {
  EXPECT_EQ(world->port().open(world->path() + '\0').error(), std::errc::invalid_argument);
  const auto full = world->port().open(world->pathOnAFullDisk());
  ASSERT_TRUE(full);
  for (int i = 0; i < 2; ++i) EXPECT_EQ((*full)->append("bytes"), std::errc::no_space_on_device);
  EXPECT_EQ(world->port().open(world->pathInNoFolder()).error(),
            std::errc::no_such_file_or_directory);
  EXPECT_EQ(world->text(), "");
}

class FakeAppendFilesWorld final : public FakeColumn<AppendFilesWorld, Testing::FakeAppendFiles> {
 public:
  std::string path() override { return "/log"; }
  std::string text() override { return port_.text(path()); }
  std::string pathOnAFullDisk() override {
    port_.failure = std::errc::no_space_on_device;
    port_.faults->plan(Testing::Fault::fails, port_.faults->calls() + 2);
    return "/full";
  }
  std::string pathInNoFolder() override {
    port_.faults->plan(Testing::Fault::absent, 1);
    return "/missing/log";
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, AppendFilesContract, on<FakeAppendFilesWorld>());

TEST_P(ExtendedAttributesContract, GivesAllBytesAndTellsAbsentFromFailed) {
  ExtendedAttributes& attributes = world->port();
  for (const std::string& value : {""s, "a\0b;\xFF"s, std::string(3000, 'x')}) {
    world->set("note", value);
    EXPECT_EQ(*attributes.value(world->path(), "note"), value);
  }
  EXPECT_EQ(*attributes.value(world->path(), "other"), std::nullopt);
  EXPECT_EQ(*attributes.value(world->path(), "not"), std::nullopt);
  for (const auto& [path, name] :
       {std::pair(world->path(), ""s), {world->path(), "note\0"s}, {world->path() + '\0', "note"s}})
    EXPECT_EQ(attributes.value(path, name).error(), std::errc::invalid_argument);

  const std::string bare = world->pathWithoutAttributes();
  EXPECT_EQ(attributes.value(bare, "note").error(), std::errc::not_supported);
  const std::string missing = world->missingPath();
  EXPECT_EQ(attributes.value(missing, "note").error(), std::errc::no_such_file_or_directory);
}

class FakeExtendedAttributesWorld final
    : public FakeColumn<ExtendedAttributesWorld, Testing::FakeExtendedAttributes> {
 public:
  std::string path() override { return "/file"; }
  void set(const std::string& name, const std::string& value) override {
    port_.values[{path(), name}] = value;
  }
  std::string missingPath() override { return failing(std::errc::no_such_file_or_directory); }
  std::string pathWithoutAttributes() override { return failing(std::errc::not_supported); }

 private:
  std::string failing(std::errc error) {
    port_.error = std::make_error_code(error);
    return "/other";
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, ExtendedAttributesContract, on<FakeExtendedAttributesWorld>());

TEST_P(PrivateFilesContract, PreparesAFileAndChangesNoneThatExists) {
  const Tests::TemporaryFolder folder;
  const std::string path = folder.path() / "new" / "folders" / "file";
  EXPECT_EQ(world->port().identity(path), std::nullopt);
  EXPECT_EQ(*world->port().prepare(path), path);
  const auto identity = world->port().identity(path);
  ASSERT_TRUE(identity);
  EXPECT_TRUE(identity->isEmpty);
  std::ofstream(path) << "bytes";
  fs::create_directory_symlink(folder.path() / "new", folder.path() / "link");
  EXPECT_EQ(*world->port().prepare(folder.path() / "link" / "folders" / "file"), path);
  EXPECT_FALSE(world->port().protect(path));
  EXPECT_EQ(*readFile(path), "bytes");
  EXPECT_EQ(world->port().identity(path), identity);
  EXPECT_FALSE(world->port().identity(path)->isEmpty);

  // Another file behind the same path is another.
  EXPECT_FALSE(world->port().rename(*world->port().prepare(path + "2"), path));
  EXPECT_EQ(*readFile(path), "");
  EXPECT_NE(world->port().identity(path), identity);
  for (int i = 0; i < 2; ++i) EXPECT_FALSE(world->port().remove(path));
  EXPECT_EQ(world->port().rename(path, path + "3"), std::errc::no_such_file_or_directory);
}

TEST_P(PrivateFilesContract, RefusesWhatIsNoFileOfTheUser) {
  const Tests::TemporaryFolder folder;
  const std::string target = folder.write("target", "bytes");
  const std::string path = folder.path() / "file";
  for (const char* suffix : {"", "-journal", "-wal", "-shm"}) {
    fs::create_symlink(target, path + suffix);
    EXPECT_EQ(world->port().prepare(path).error().domain(), privateFileRefusalDomain) << suffix;
    fs::remove(path + suffix);
    fs::create_directory(path + suffix);
    EXPECT_EQ(world->port().prepare(path).error().domain(), privateFileRefusalDomain) << suffix;
    EXPECT_TRUE(fs::remove(path + suffix));
  }
  EXPECT_FALSE(world->port().prepare(target + "/file"));
  EXPECT_FALSE(world->port().prepare(""));
  EXPECT_EQ(*readFile(target), "bytes");

  const std::string cut = target + '\0';
  const long reason = static_cast<long>(std::errc::invalid_argument);
  EXPECT_EQ(world->port().prepare(cut).error().code(), reason);
  EXPECT_EQ(world->port().tryLock(cut).error().code(), reason);
  EXPECT_EQ(world->port().identity(cut), std::nullopt);
  for (const auto& error : {world->port().protect(cut), world->port().remove(cut),
                            world->port().rename(cut, path), world->port().rename(target, cut)})
    EXPECT_EQ(error, std::errc::invalid_argument);
  EXPECT_EQ(*readFile(target), "bytes");
}

TEST_P(PrivateFilesContract, GivesALockToOneAtATime) {
  const Tests::TemporaryFolder folder;
  const std::string path = folder.path() / "new" / "lock";
  for (int i = 0; i < 2; ++i) {
    const auto lock = world->port().tryLock(path);
    ASSERT_TRUE(lock && *lock);
    const auto second = world->port().tryLock(path);
    ASSERT_TRUE(second);
    EXPECT_EQ(*second, nullptr);
    EXPECT_TRUE(*world->port().tryLock(path + "2")) << "of another file";
  }
  EXPECT_FALSE(world->port().tryLock(folder.path()));
}

// Whose files are real: a database opens them by their path.
class FakePrivateFilesWorld final : public WorldOf<PrivateFiles> {
 public:
  PrivateFiles& port() override { return files_; }

 private:
  Testing::FaultyPrivateFiles files_{systemPorts().privateFiles};
};
INSTANTIATE_TEST_SUITE_P(Fake, PrivateFilesContract, on<FakePrivateFilesWorld>());

TEST_P(SecurityScopeContract, OpensForFilesThatTheProcessMayRead) {
  SecurityScope& scope = world->port();
  for (const URL& url : {world->readable(false), world->readable(true)}) {
    for (int i = 0; i < 2; ++i) EXPECT_TRUE(scope.startAccessing(url));
    for (int i = 0; i < 2; ++i) scope.stopAccessing(url);
    EXPECT_TRUE(scope.startAccessing(url));
    scope.stopAccessing(url);
    const std::string path = url.path();
    EXPECT_FALSE(scope.startAccessing(*URL::parse("https://h.example" + path))) << path;
    EXPECT_FALSE(scope.startAccessing(*URL::parse("file://" + path + "%00"))) << path;
  }
  EXPECT_FALSE(scope.startAccessing(world->forbidden()));
}

class FakeSecurityScopeWorld final
    : public FakeColumn<SecurityScopeWorld, Testing::FakeSecurityScope> {
 public:
  FakeSecurityScopeWorld() { port_.forbid(forbidden()); }
  URL readable(bool isFolder) override {
    return *URL::parse(isFolder ? "file:///f/" : "file:///f");
  }
  URL forbidden() override { return *URL::parse("file:///forbidden"); }
};
INSTANTIATE_TEST_SUITE_P(Fake, SecurityScopeContract, on<FakeSecurityScopeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
