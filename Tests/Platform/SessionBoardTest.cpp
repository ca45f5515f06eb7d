// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sys/stat.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <stop_token>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/SessionBoard.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Wait = SessionBoard::Wait;

std::unique_ptr<SessionBoard> makeBoard() {
  return POSIX::makeSessionBoard(systemPorts().privateFiles);
}

TEST(SessionBoard, KeepsItsFilesToTheUserAndTakesNoneThatOthersPutThere) {
  const Tests::TemporaryFolder folder;
  ::setenv("XDG_RUNTIME_DIR", folder.path().c_str(), 1);
  const auto board = makeBoard();
  const mode_t before = ::umask(0);
  ASSERT_FALSE(board->post("note"));
  const auto place = board->takePlace("../../disk", 1, Wait::no);
  ::umask(before);
  std::size_t files = 0;
  for (const auto& each : fs::recursive_directory_iterator(folder.path()))
    if (each.is_regular_file()) {
      struct stat facts {};
      ASSERT_EQ(::stat(each.path().c_str(), &facts), 0);
      EXPECT_EQ(facts.st_mode & 0777, 0600u) << each.path();
      ++files;
    }
  EXPECT_EQ(files, 2u) << "nothing lies outside";

  const fs::path notes = folder.path() / "varnel" / "processes";
  ASSERT_EQ(::mkfifo((notes / "1.fifo").c_str(), 0600), 0);
  fs::create_symlink("/etc/passwd", notes / "1.link");
  fs::create_directory(notes / "1.folder");
  const fs::path left = folder.write("varnel/processes/1.left", "of a process that was killed");
  EXPECT_EQ(board->notes(), (std::vector<SessionBoard::Note>{{::getpid(), "note"}}));
  EXPECT_FALSE(fs::exists(left));
}

TEST(SessionBoard, KeepsANoteThatIsPostedWhileOthersLook) {
  const Tests::TemporaryFolder folder;
  ::setenv("XDG_RUNTIME_DIR", folder.path().c_str(), 1);
  const auto board = makeBoard();
  std::atomic<int> looks = 0;
  std::jthread other([&](const std::stop_token& stop) {
    for (const auto own = makeBoard(); !stop.stop_requested(); ++looks) (void)own->notes();
  });
  for (int i = 0; i < 50; ++i) {
    while (board->post("note")) continue;  // one that is half posted may be taken away
    for (const int before = looks; looks < before + 2;) std::this_thread::yield();
    EXPECT_EQ(board->notes().size(), 1u);
  }
}

TEST(SessionBoard, MeansNothingWhereTheSessionHasNoFolder) {
  const Tests::TemporaryFolder folder;
  const std::string file = folder.write("file", "").string();
  for (const std::string value : {"", "relative", "/proc/missing", file.c_str()}) {
    ::setenv("XDG_RUNTIME_DIR", value.c_str(), 1);
    const auto board = makeBoard();
    const auto first = board->takePlace("disk", 1, Wait::no);
    EXPECT_TRUE(first && board->takePlace("disk", 1, Wait::forPlace)) << value;
    EXPECT_TRUE(board->post("note")) << value;
    EXPECT_TRUE(board->notes().empty()) << value;
  }
}

TEST(SessionBoard, PassesOverWhatAStoppedProcessKeeps) {
  const Tests::TemporaryFolder folder;
  ::setenv("XDG_RUNTIME_DIR", folder.path().c_str(), 1);
  const auto stopped = makeBoard();
  const auto board = POSIX::makeSessionBoard(systemPorts().privateFiles, 20ms);
  for (const unsigned count : {1u, 2u}) {
    const std::string name = std::to_string(count);
    const auto first = stopped->takePlace(name, count, Wait::no);
    const auto last = count > 1 ? stopped->takePlace(name, count, Wait::no) : nullptr;
    EXPECT_FALSE(board->takePlace(name, count, Wait::no));
    EXPECT_TRUE(board->takePlace(name, count, Wait::forPlace));
    EXPECT_TRUE(board->takePlace(name, count, Wait::no)) << "nobody waits for it anew";
    EXPECT_FALSE(makeBoard()->takePlace(name, count, Wait::no)) << "it is still kept";
  }
}

}  // namespace
}  // namespace Varnel::Platform
