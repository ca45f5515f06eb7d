// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/StandardOutput.h>

#include <pthread.h>
#include <signal.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/POSIX/StandardStreams.h>

namespace Varnel::Platform::Bare {
namespace {

// While it lives, a write to a pipe without a reader only fails. The signal that comes with it goes
// to the writing thread, and is consumed here whatever the process does with signals.
class BrokenPipeIsNoSignal final {
 public:
  BrokenPipeIsNoSignal() {
    ::sigemptyset(&brokenPipe_);
    ::sigaddset(&brokenPipe_, SIGPIPE);
    ::pthread_sigmask(SIG_BLOCK, &brokenPipe_, &before_);
    wasPending_ = isPending();
  }
  ~BrokenPipeIsNoSignal() {
    int consumed = 0;
    if (!wasPending_ && isPending()) ::sigwait(&brokenPipe_, &consumed);
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
  }
  BrokenPipeIsNoSignal(const BrokenPipeIsNoSignal&) = delete;
  BrokenPipeIsNoSignal& operator=(const BrokenPipeIsNoSignal&) = delete;

 private:
  static bool isPending() {
    sigset_t pending;
    ::sigpending(&pending);
    return ::sigismember(&pending, SIGPIPE) == 1;
  }

  sigset_t brokenPipe_;
  sigset_t before_;
  bool wasPending_ = false;
};

// Writes each text at once, behind what the host has printed: nothing of the framework's own is
// ever left in a buffer, to be lost, written twice after a fork, or written into a broken pipe by
// the C library.
class UnbufferedStream final : public StandardOutput {
 public:
  explicit UnbufferedStream(std::FILE* stream) : stream_(stream) {}

  void print(std::string_view text) override {
    if (!isThere_) return;
    const BrokenPipeIsNoSignal guard;
    ::flockfile(stream_);
    if (std::fflush(stream_) == 0) write(text);
    ::funlockfile(stream_);
  }

 private:
  void write(std::string_view text) const {
    while (!text.empty()) {
      const ssize_t size = ::write(::fileno(stream_), text.data(), text.size());
      if (size < 0 && errno == EINTR) continue;
      if (size <= 0) return;
      text.remove_prefix(static_cast<std::size_t>(size));
    }
  }

  std::FILE* stream_;
  const bool isThere_ = POSIX::wasOpenAtStart(stream_);
};

}  // namespace

std::unique_ptr<StandardOutput> makeStandardOutput() {
  return std::make_unique<UnbufferedStream>(stdout);
}

}  // namespace Varnel::Platform::Bare

namespace Varnel::Platform {

std::unique_ptr<StandardOutput> makeStandardErrorOutput() {
  return std::make_unique<Bare::UnbufferedStream>(stderr);
}

}  // namespace Varnel::Platform
