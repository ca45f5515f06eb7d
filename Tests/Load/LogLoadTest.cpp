// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include <Tests/Load/LoadTime.h>
#include <Tests/Support/Crew.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

/// A small disk that this process alone sees, where the system lets it have one.
class SmallDisk final {
 public:
  explicit SmallDisk(fs::path folder)
      : folder_(std::move(folder)),
        isMounted_(::unshare(CLONE_NEWNS) == 0 &&
                   ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
                   ::mount("load", folder_.c_str(), "tmpfs", 0, "size=16m") == 0) {}
  ~SmallDisk() {
    if (isMounted_) ::umount2(folder_.c_str(), MNT_DETACH);
  }
  [[nodiscard]] bool isMounted() const { return isMounted_; }

 private:
  const fs::path folder_;
  const bool isMounted_;
};

/// Fills the disk and frees it again.
class Filler final {
 public:
  explicit Filler(const fs::path& folder)
      : file_(::open((folder / "filler").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600)) {}
  ~Filler() { ::close(file_); }

  void fill() {
    const std::string block(1 << 16, ' ');
    while (::write(file_, block.data(), block.size()) > 0) continue;
  }
  void free() {
    EXPECT_EQ(::ftruncate(file_, 0), 0);
    EXPECT_EQ(::lseek(file_, 0, SEEK_SET), 0);
  }

 private:
  const int file_;
};

std::size_t countOf(const std::string& text, const std::string& part) {
  std::size_t count = 0;
  for (std::size_t at = 0; (at = text.find(part, at)) != text.npos; at += part.size()) ++count;
  return count;
}

// Other threads of the test would not see the disk: it runs before there are any.
TEST(LogLoad, EveryEntryIsOnTheDiskOrSaidToBeMissingWhileTheDiskFillsAndFrees) {
  const Tests::TemporaryFolder home;
  const SmallDisk smallDisk(home.path());
  if (!smallDisk.isMounted()) GTEST_SKIP() << "this process cannot mount a disk";
  Platform::Testing::FakePorts fakes;
  fakes.userAccount.home = home.path().string();
  Platform::Ports ports = fakes.ports();
  ports.appendFiles = Platform::systemPorts().appendFiles;
  Filler filler(home.path());
  std::size_t logged = 0;
  {
    Logger logger(ports, "com.quennel.Load");
    const auto end = Tests::endOfLoad();
    std::atomic<std::size_t> entries = 0;
    std::atomic<bool> isOver = false;
    std::thread disk([&] {
      for (; !isOver; std::this_thread::sleep_for(5ms)) {
        filler.fill();
        std::this_thread::sleep_for(5ms);
        filler.free();
      }
    });
    Tests::Crew crew(32, [&](unsigned thread) {
      for (unsigned number = 0; std::chrono::steady_clock::now() < end && number < 2000; ++number) {
        logger.log("<" + std::to_string(thread) + ":" + std::to_string(number) + ">", "Load");
        ++entries;
        std::this_thread::sleep_for(1ms);
      }
    });
    crew.join();
    isOver = true;
    disk.join();
    filler.free();
    logger.log("<last>", "Load");
    logged = entries;
  }
  std::string text;
  for (const auto& each : fs::recursive_directory_iterator(home.path() / "Library"))
    if (each.path().extension() == ".log") {
      std::ifstream file(each.path());
      text.append(std::istreambuf_iterator<char>(file), {});
    }
  EXPECT_EQ(countOf(text, "<last>"), 1u);
  std::set<std::string> found;
  std::size_t twice = 0;
  for (std::size_t at = 0; (at = text.find('<', at)) != text.npos; ++at) {
    const std::size_t last = text.find_first_of("<>\n", at + 1);
    if (last != text.npos && text[last] == '>')
      twice += !found.insert(text.substr(at, last - at)).second;
  }
  const std::size_t failures = countOf(fakes.standardOutput.text(), "Did fail to write");
  EXPECT_EQ(twice, 0u);
  EXPECT_LE(logged + 1, found.size() + failures);
  std::printf("%zu entries, %zu on the disk, %zu said to be missing\n", logged + 1, found.size(),
              failures);
}

}  // namespace
}  // namespace Varnel
