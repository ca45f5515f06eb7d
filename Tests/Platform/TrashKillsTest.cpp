// SPDX-License-Identifier: MIT
#include <sys/syscall.h>

#include <fstream>

#include <Tests/Platform/TrashFixture.h>
#include <Tests/Support/TracedChild.h>

// What comes between two system calls: the end of the process, or another program.
namespace Varnel::Tests {
namespace {

namespace fs = std::filesystem;

class TrashKillsTest : public TrashFixture {
 protected:
  void SetUp() override {
    if (const std::string reason = whyNotTraced(); !reason.empty()) GTEST_SKIP() << reason;
  }

  // Kills the work before its first call, then before its second, until it comes to its end.
  // Returns how many kills there were.
  template <typename Work>
  unsigned killEverywhere(Work work) {
    for (unsigned last = 1;; ++last) {
      arrange();
      const bool isDone =
          inTracedChild(work, [last](unsigned call, std::uint64_t) { return call < last; });
      expectSafe(last);
      if (isDone || testing::Test::HasFailure()) return last - 1;
    }
  }

  std::function<void()> arrange = [] {};

  void expectSafe(unsigned last) const {
    std::vector<TrashedFile> ours = contents();
    std::erase_if(ours, [this](const TrashedFile& each) {
      return each.path != file || bytes(each) != "bytes";
    });
    EXPECT_EQ(ours.size() + (bytes(file) == "bytes" ? 1 : 0), 1u) << "killed before call " << last;
  }
};

TEST_F(TrashKillsTest, AFileIsAlwaysInItsPlaceOrInTheTrashWithItsInfo) {
  arrange = [this] {
    for (const TrashedFile& each : contents())
      static_cast<void>(trash->restore(each, Folders::leave));
  };
  const unsigned moves = killEverywhere([this] { EXPECT_TRUE(move(file)); });
  EXPECT_GE(moves, 40u);
  RecordProperty("moves", static_cast<int>(moves));

  arrange = [this] {
    if (fs::exists(file)) static_cast<void>(move(file));
  };
  const unsigned returns =
      killEverywhere([this] { EXPECT_FALSE(trash->restore(contents().at(0), Folders::recreate)); });
  EXPECT_GE(returns, 20u);
  RecordProperty("returns", static_cast<int>(returns));
  EXPECT_EQ(bytes(file), "bytes");
}

// Another program acts right before the file is moved, and before it is moved back.
TEST_F(TrashKillsTest, WhatCameBetweenIsMovedBackOrKeptWithItsInfo) {
  const fs::path other = home.write("files/other", "other");
  const fs::path away = home.path() / "away";
  const auto nothing = [] {};
  const auto swap = [&] {
    fs::rename(file, away);
    fs::rename(other, file);
  };
  const auto swapForLink = [&] {
    fs::rename(file, away);
    fs::create_symlink(other, file);
  };
  const auto append = [&] { std::ofstream(file, std::ios::app) << "!"; };
  const auto occupy = [&] { std::ofstream(file) << "new"; };
  const auto empty = [&] {
    fs::remove_all(folder + "/info"), fs::create_directory(folder + "/info");
  };
  const struct {
    const char* what;
    std::function<void()> first;
    std::function<void()> second;
    Reason reason;
    std::string inPlace;
    std::string inTrash;
  } rows[] = {
      {"another file", swap, nothing, Reason::changed, "other", ""},
      {"a link", swapForLink, nothing, Reason::changed, "other", ""},
      {"written to", append, nothing, Reason::changed, "bytes!", ""},
      {"gone", [&] { fs::rename(file, away); }, nothing, Reason::changed, "nothing", ""},
      {"trash emptied", empty, nothing, Reason::failed, "bytes", ""},
      {"place taken", swap, occupy, Reason::misplaced, "new", "other"},
  };
  for (const auto& row : rows) {
    unsigned moves = 0;
    const bool isDone = inTracedChild(
        [&] {
          const auto moved = move(file);
          ASSERT_FALSE(moved) << row.what;
          EXPECT_EQ(moved.error().reason, row.reason) << row.what;
        },
        [&](unsigned, std::uint64_t call) {
          if (call == SYS_renameat2) (++moves == 1 ? row.first : row.second)();
          return true;
        });
    EXPECT_TRUE(isDone) << row.what;
    EXPECT_EQ(bytes(file), row.inPlace) << row.what;
    EXPECT_TRUE(fs::is_empty(folder + "/info") == row.inTrash.empty()) << row.what;
    std::string found;
    for (const TrashedFile& each : contents()) found += bytes(each);
    EXPECT_EQ(found, row.inTrash) << row.what;

    fs::remove(file);
    home.write("files/a", "bytes");
    home.write("files/other", "other");
  }
}

}  // namespace
}  // namespace Varnel::Tests
