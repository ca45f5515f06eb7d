// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ProcessLauncher.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <fstream>
#include <optional>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Linux {
namespace {

using POSIX::FileDescriptor;

std::error_code systemError(int code) {
  return {code, std::generic_category()};
}

struct Pipe {
  FileDescriptor readEnd;
  FileDescriptor writeEnd;
};

std::optional<Pipe> makePipe() {
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC) != 0) return std::nullopt;
  Pipe pipe{FileDescriptor(ends[0]), FileDescriptor(ends[1])};
  if (!pipe.readEnd || !pipe.writeEnd) return std::nullopt;
  return pipe;
}

void enlarge(const FileDescriptor& pipe) {
  constexpr int usualMaxSize = 1 << 20;
  int maxSize = 0;
  if (!(std::ifstream("/proc/sys/fs/pipe-max-size") >> maxSize)) maxSize = usualMaxSize;
  // A user who has many large pipes may be refused; the pipe then keeps its size.
  ::fcntl(pipe.get(), F_SETPIPE_SZ, maxSize);
}

// What the child does between its birth and the program's start.
class SpawnSettings final {
 public:
  SpawnSettings(const Pipe& input, const Pipe& output) {
    ::posix_spawn_file_actions_init(&actions_);
    ::posix_spawn_file_actions_adddup2(&actions_, input.readEnd.get(), STDIN_FILENO);
    ::posix_spawn_file_actions_adddup2(&actions_, output.writeEnd.get(), STDOUT_FILENO);
    ::posix_spawn_file_actions_addclosefrom_np(&actions_, STDERR_FILENO + 1);

    // A group of its own lets the program be ended together with what it has started. The host's
    // own choice of blocked and ignored signals is not passed on.
    sigset_t none;
    sigset_t all;
    ::sigemptyset(&none);
    ::sigfillset(&all);
    ::posix_spawnattr_init(&attributes_);
    ::posix_spawnattr_setpgroup(&attributes_, 0);
    ::posix_spawnattr_setsigmask(&attributes_, &none);
    ::posix_spawnattr_setsigdefault(&attributes_, &all);
    ::posix_spawnattr_setflags(
        &attributes_, POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  }
  ~SpawnSettings() {
    ::posix_spawnattr_destroy(&attributes_);
    ::posix_spawn_file_actions_destroy(&actions_);
  }
  SpawnSettings(const SpawnSettings&) = delete;
  SpawnSettings& operator=(const SpawnSettings&) = delete;

  // 0, or the error number.
  int spawn(pid_t& process, const std::string& path, const std::vector<std::string>& arguments) {
    std::vector<char*> texts = {const_cast<char*>(path.c_str())};
    for (const std::string& argument : arguments)
      texts.push_back(const_cast<char*>(argument.c_str()));
    texts.push_back(nullptr);
    return ::posix_spawn(&process, path.c_str(), &actions_, &attributes_, texts.data(), environ);
  }

 private:
  posix_spawn_file_actions_t actions_;
  posix_spawnattr_t attributes_;
};

class SpawnedProcess final : public LaunchedProcess {
 public:
  SpawnedProcess(pid_t process, FileDescriptor input, FileDescriptor output)
      : process_(process), input_(std::move(input)), output_(std::move(output)) {
    // The reader must not wait for processes that the program started and left behind.
    ::fcntl(output_.get(), F_SETFL, O_NONBLOCK);
    descriptor_ = FileDescriptor(static_cast<int>(::syscall(SYS_pidfd_open, process_, 0)));
  }
  ~SpawnedProcess() override { terminate(); }

  bool isRunning() override {
    if (hasEnded_) return false;
    if (descriptor_) {
      pollfd event{descriptor_.get(), POLLIN, 0};
      if (::poll(&event, 1, 0) == 0) return true;
    }
    collect(WNOHANG);
    return !hasEnded_;
  }

  void terminate() override {
    // Until the child's end is collected, no other process can get its number.
    if (hasEnded_) return;
    ::kill(-process_, SIGKILL);
    ::kill(process_, SIGKILL);  // The child may have left its group.
    collect(0);
  }

  // Processes that the program left behind may still be writing. More than a pipeful is not the
  // program's.
  std::string readOutput() override {
    const int capacity = std::max(::fcntl(output_.get(), F_GETPIPE_SZ), 0);
    std::string text(static_cast<std::size_t>(capacity), '\0');
    std::size_t filled = 0;
    while (filled < text.size()) {
      const ssize_t length = ::read(output_.get(), text.data() + filled, text.size() - filled);
      if (length < 0 && errno == EINTR) continue;
      if (length <= 0) break;
      filled += static_cast<std::size_t>(length);
    }
    text.resize(filled);
    return text;
  }

 private:
  void collect(int options) {
    pid_t collected = 0;
    do {
      collected = ::waitpid(process_, nullptr, options);
    } while (collected < 0 && errno == EINTR);
    // A host that ignores the ends of its children leaves nothing to collect.
    hasEnded_ = collected != 0;
  }

  const pid_t process_;
  FileDescriptor input_;
  FileDescriptor output_;
  FileDescriptor descriptor_;  ///< Of the process; none on old kernels.
  bool hasEnded_ = false;
};

class Spawner final : public ProcessLauncher {
 public:
  Result<std::unique_ptr<LaunchedProcess>, std::error_code> launch(
      const std::string& path, const std::vector<std::string>& arguments) override {
    if (isCutShort(path) || std::ranges::any_of(arguments, isCutShort)) return systemError(EINVAL);
    auto input = makePipe();
    auto output = input ? makePipe() : std::nullopt;
    if (!output) return systemError(errno);
    enlarge(output->writeEnd);
    SpawnSettings settings(*input, *output);
    pid_t process = -1;
    if (const int failed = settings.spawn(process, path, arguments)) return systemError(failed);
    return std::unique_ptr<LaunchedProcess>(std::make_unique<SpawnedProcess>(
        process, std::move(input->writeEnd), std::move(output->readEnd)));
  }
};

}  // namespace

std::unique_ptr<ProcessLauncher> makeProcessLauncher() {
  return std::make_unique<Spawner>();
}

}  // namespace Varnel::Platform::Linux
