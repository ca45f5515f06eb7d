// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <gmock/gmock.h>

#include <Varnel/Platform/Testing/FakeTrash.h>

namespace Varnel::Platform::Contract {
namespace {

using Reason = TrashError::Reason;
using Folders = Trash::Folders;

bool always(const TrashedFile&) {
  return true;
}

TEST_P(TrashContract, TakesFilesAndGivesBackThoseVeryOnes) {
  Trash& trash = world->port();
  std::vector<TrashedFile> gone;
  std::vector<std::string> folders{"/a", "/b", "/c"};
  for (std::size_t i = 0; i < folders.size(); ++i) {
    const std::string path = world->folder() + folders[i] + "/photo";
    world->write(path, 100 + i);
    const FileState state = *trash.state(path);
    EXPECT_EQ(state.size, 100 + i);
    TrashedFile told;
    const auto moved = trash.move(path, state, [&](const TrashedFile& planned) {
      told = planned;
      return world->exists(path);
    });
    ASSERT_TRUE(moved);
    EXPECT_EQ(*moved, told);
    EXPECT_EQ(moved->path, path);
    EXPECT_EQ(moved->state, state);
    EXPECT_FALSE(world->exists(path));
    EXPECT_EQ(*trash.folderFor(world->folder() + "/a/other"), moved->folder);
    EXPECT_TRUE(trash.isInTrash(moved->folder + "/files/" + moved->name));
    EXPECT_FALSE(trash.isInTrash(moved->path));
    gone.push_back(*moved);
    EXPECT_THAT(*trash.contents(moved->folder), testing::UnorderedElementsAreArray(gone));
  }
  for (const TrashedFile& file : gone) {
    EXPECT_FALSE(trash.restore(file, Folders::leave));
    EXPECT_EQ(*trash.state(file.path), file.state);
    EXPECT_EQ(trash.restore(file, Folders::leave)->reason, Reason::emptied) << "again";
  }
  EXPECT_THAT(*trash.contents(gone[0].folder), testing::IsEmpty());
  EXPECT_THAT(*trash.contents(world->folder() + "/none"), testing::IsEmpty());
}

TEST_P(TrashContract, TakesNoFileButTheOneExpected) {
  Trash& trash = world->port();
  const std::string path = world->folder() + "/a";
  world->write(path, 5);
  const FileState state = *trash.state(path);
  for (auto member : {&FileState::device, &FileState::inode, &FileState::size}) {
    FileState other = state;
    ++(other.*member);
    EXPECT_EQ(trash.move(path, other, always).error().reason, Reason::changed);
  }
  EXPECT_EQ(trash.move(path + "b", state, always).error().reason, Reason::changed);
  EXPECT_EQ(trash.state(path + "b").error().reason, Reason::changed);
  const auto never = [](const TrashedFile&) { return false; };
  EXPECT_EQ(trash.move(path, state, never).error().reason, Reason::declined);
  const auto tooLate = [&](const TrashedFile&) {
    world->write(path, 6);
    return true;
  };
  EXPECT_EQ(trash.move(path, state, tooLate).error().reason, Reason::changed);
  EXPECT_EQ(trash.state(path)->size, 6u);
  EXPECT_THAT(*trash.contents(*trash.folderFor(path)), testing::IsEmpty());

  for (const std::string& bad : {std::string("a"), std::string(), path + '\0'}) {
    const auto invalid = std::errc::invalid_argument;
    EXPECT_EQ(trash.state(bad).error().code, invalid);
    EXPECT_EQ(trash.folderFor(bad).error().code, invalid);
    EXPECT_EQ(trash.move(bad, state, always).error().code, invalid);
  }
  EXPECT_EQ(trash.folderFor(world->pathWithoutTrash()).error().reason, Reason::noTrash);
}

TEST_P(TrashContract, PutsBackWithoutReplacingAnything) {
  Trash& trash = world->port();
  const std::string path = world->folder() + "/sub/a";
  world->write(path, 5);
  const TrashedFile file = *trash.move(path, *trash.state(path), always);
  world->write(path, 6);
  EXPECT_EQ(trash.restore(file, Folders::recreate)->reason, Reason::occupied);
  EXPECT_EQ(trash.state(path)->size, 6u);
  world->remove(world->folder() + "/sub");
  EXPECT_EQ(trash.restore(file, Folders::leave)->reason, Reason::folderMissing);
  EXPECT_FALSE(trash.restore(file, Folders::recreate));
  EXPECT_EQ(*trash.state(path), file.state);

  // Another file has its name in the trash.
  const TrashedFile first = *trash.move(path, file.state, always);
  world->empty(first);
  EXPECT_EQ(trash.restore(first, Folders::leave)->reason, Reason::emptied);
  world->write(path, 7);
  const TrashedFile second = *trash.move(path, *trash.state(path), always);
  EXPECT_EQ(trash.restore(first, Folders::leave)->reason, Reason::emptied);
  EXPECT_FALSE(trash.restore(second, Folders::leave));
  EXPECT_EQ(trash.state(path)->size, 7u);
}

class FakeTrashWorld final : public FakeColumn<TrashWorld, Testing::FakeTrash> {
 public:
  FakeTrashWorld() { port_.foldersWithoutTrash = {"/network"}; }
  std::string folder() override { return "/home"; }
  void write(const std::string& path, std::size_t size) override {
    port_.files[path] = {.inode = ++inode_, .size = size};
  }
  bool exists(const std::string& path) override { return port_.files.contains(path); }
  void remove(const std::string& folder) override {
    port_.missingFolders.insert(folder);
    std::erase_if(port_.files,
                  [&](const auto& file) { return file.first.starts_with(folder + "/"); });
  }
  void empty(const TrashedFile& file) override { std::erase(port_.trashed, file); }
  std::string pathWithoutTrash() override { return "/network/file"; }

 private:
  std::uint64_t inode_ = 0;
};
INSTANTIATE_TEST_SUITE_P(Fake, TrashContract, on<FakeTrashWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
