// SPDX-License-Identifier: MIT
// Eight threads that read, in so many turns each, a disk which admits one reader and is shared by
// several such processes: SharingReader TURNS PROBE. The exit status is 9 when somebody else was on
// the disk at the same time.
#include <fcntl.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <future>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/Platform/Ports/SessionBoard.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Varnel {
namespace {

using Platform::URL;

/// A file of which each process that is on the disk has locked the byte of its number.
class Probe final {
 public:
  explicit Probe(const char* path) : file_(::open(path, O_RDWR | O_CREAT | O_CLOEXEC, 0600)) {}

  void enter() {
    const bool isAlone = inside_.fetch_add(1) == 0;
    set(F_WRLCK);
    const pid_t other = another();
    if (isAlone && (other == 0 || isEnding(other))) return;
    std::puts("two at once");
    std::fflush(stdout);
    std::_Exit(9);
  }
  void leave() {
    set(F_UNLCK);
    --inside_;
  }

 private:
  void set(short kind) const {
    struct flock lock {};
    lock.l_type = kind;
    lock.l_start = ::getpid();
    lock.l_len = 1;
    if (::fcntl(file_, F_OFD_SETLK, &lock) != 0) std::abort();
  }
  /// 0 when there is none.
  [[nodiscard]] pid_t another() const {
    struct flock lock {};
    lock.l_type = F_WRLCK;
    if (::fcntl(file_, F_OFD_GETLK, &lock) != 0) std::abort();
    return lock.l_type == F_UNLCK ? 0 : static_cast<pid_t>(lock.l_start);
  }
  /// The system closes the files of a process that was killed one after another, and may close this
  /// one last. The process counts as ending by then.
  static bool isEnding(pid_t process) {
    std::ifstream file("/proc/" + std::to_string(process) + "/stat");
    std::string text;
    std::getline(file, text);
    std::istringstream facts(text.substr(text.rfind(')') + 1));
    char state = 'X';
    long ignored = 0;
    unsigned long flags = 0;
    facts >> state;
    for (int i = 0; i < 5; ++i) facts >> ignored;
    facts >> flags;
    constexpr unsigned long isExiting = 4;
    return state == 'X' || state == 'Z' || (flags & isExiting) != 0;
  }

  const int file_;
  std::atomic<int> inside_ = 0;
};

class Reader final : public DiskReadingTask {
 public:
  explicit Reader(Probe& probe) : probe_(probe) {}
  DiskReadingNext run(DiskReadingTurn&) override {
    probe_.enter();
    std::this_thread::yield();
    probe_.leave();
    return DiskReadingNext::done();
  }
  void didEnd(DiskReadingResult) override { ended_.set_value(); }
  void await() { ended_.get_future().wait(); }

 private:
  Probe& probe_;
  std::promise<void> ended_;
};

}  // namespace
}  // namespace Varnel

int main(int count, char** arguments) {
  using namespace Varnel;
  if (count != 3) return 2;
  static Probe probe(arguments[2]);
  const int turns = std::atoi(arguments[1]);
  static auto& fakes = *new Platform::Testing::FakePorts;
  const URL stick = URL::fileURLWithPath("/stick/");
  fakes.volumeCatalog.mount({.url = stick, .isLocal = true, .isInternal = false, .uuid = "STICK"});
  static auto& manager = *new DiskAccessManager(fakes.ports());
  static auto& queue =
      *new DiskReadingQueue(manager, {.readingPriority = fakes.readingPriority,
                                      .sharedPlaces = &Platform::systemPorts().sessionBoard.get()});
  if (!queue.diskOfVolume(stick)) return 3;  // also waits for the inventory
  std::vector<std::thread> threads;
  for (int i = 0; i < 8; ++i)
    threads.emplace_back([&] {
      for (int turn = 0; turn < turns; ++turn) {
        const auto reader = std::make_shared<Reader>(probe);
        queue.submit(reader, {.url = stick, .volumeURL = stick}, {.propose = "load"});
        reader->await();
      }
    });
  for (std::thread& thread : threads) thread.join();
  std::puts("done");
  std::fflush(stdout);
  std::_Exit(0);
}
