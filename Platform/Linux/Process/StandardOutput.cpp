// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/StandardOutput.h>

#include <pthread.h>
#include <signal.h>
#include <stdio_ext.h>
#include <sys/stat.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <optional>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/StandardStreams.h>
#include <Varnel/Platform/POSIX/SuppressedSignal.h>

namespace Varnel::Platform::Linux {
namespace {

// Holds the stream's lock, so that entries of several threads stay whole.
class LockedStream final {
 public:
  explicit LockedStream(std::FILE* stream) : stream_(stream) { ::flockfile(stream); }
  ~LockedStream() { ::funlockfile(stream_); }
  LockedStream(const LockedStream&) = delete;
  LockedStream& operator=(const LockedStream&) = delete;

 private:
  std::FILE* stream_;
};

// How the stream's file refuses a write: for want of readers, or where it may not grow.
struct Refusal {
  int signal = 0;
  int error = 0;
};

// None for a device, as a terminal, whose writes are to cost no more than they must.
std::optional<Refusal> refusalOf(std::FILE* stream) {
  struct stat facts {};
  const bool isKnown = ::fstat(::fileno(stream), &facts) == 0;
  if (isKnown && S_ISCHR(facts.st_mode)) return std::nullopt;
  if (isKnown && S_ISREG(facts.st_mode)) return Refusal{SIGXFSZ, EFBIG};
  return Refusal{SIGPIPE, EPIPE};
}

// Called with the stream's lock held, and only for a write that may go beyond the buffer.
void write(std::FILE* stream, std::string_view text, bool flushes) {
  const std::optional<Refusal> refusal = refusalOf(stream);
  std::optional<POSIX::SuppressedSignal> suppressed;
  if (refusal) suppressed.emplace(refusal->signal);
  errno = 0;  // A stream of wide text refuses this one and sets none.
  const bool isWritten = ::fwrite_unlocked(text.data(), 1, text.size(), stream) == text.size() &&
                         (!flushes || ::fflush_unlocked(stream) == 0);
  const bool isRefused = refusal && errno == refusal->error;
  // A pipe takes a part of what is larger and sends the signal, while the rest may meet its next
  // reader.
  const bool mayBeParted = std::max(::__fbufsize(stream), text.size()) > PIPE_BUF;
  if (suppressed && (isRefused || mayBeParted)) suppressed->consume();
  // Text that was refused would be written again, at the latest when the process ends.
  if (isRefused && !isWritten) ::__fpurge(stream);
}

std::atomic<bool> isProcessEnding = false;

// Does not wait for a thread that writes to a slow reader.
void flush() {
  if (::ftrylockfile(stdout) != 0) return;
  write(stdout, {}, true);
  ::funlockfile(stdout);
}

// A later write of the C library could end the process by a signal.
void flushBeforeTheEnd() {
  isProcessEnding = true;
  flush();
}

// A forked child would write the same text again, and the parent may end without it.
void flushBeforeFork() {
  flush();
}

// What other threads have printed since, or are about to, the parent writes.
void beginAnewInChild() {
  ::__fpurge(stdout);
}

class StandardStream : public StandardOutput {
 public:
  explicit StandardStream(std::FILE* stream) : stream_(stream) {}

  void print(std::string_view text) override {
    if (!isThere_) return;
    const LockedStream lock(stream_);
    if (staysInBuffer(text.size()))
      (void)::fwrite_unlocked(text.data(), 1, text.size(), stream_);
    else
      write(stream_, text, isProcessEnding);
  }

 private:
  // Most texts fit, and cost no system call.
  bool staysInBuffer(std::size_t size) const {
    return !::__flbf(stream_) && ::__fpending(stream_) + size < ::__fbufsize(stream_) &&
           !isProcessEnding.load(std::memory_order_relaxed);
  }

  std::FILE* stream_;
  const bool isThere_ = POSIX::wasOpenAtStart(stream_);
};

// A host that never prints here keeps its standard output to itself.
class BufferedStandardOutput final : public StandardStream {
 public:
  BufferedStandardOutput() : StandardStream(stdout) {}

  void print(std::string_view text) override {
    [[maybe_unused]] static const bool isWatched =
        std::atexit(flushBeforeTheEnd) == 0 &&
        ::pthread_atfork(flushBeforeFork, nullptr, beginAnewInChild) == 0;
    StandardStream::print(text);
  }
};

}  // namespace

std::unique_ptr<StandardOutput> makeStandardOutput() {
  return std::make_unique<BufferedStandardOutput>();
}

}  // namespace Varnel::Platform::Linux

namespace Varnel::Platform {

std::unique_ptr<StandardOutput> makeStandardErrorOutput() {
  return std::make_unique<Linux::StandardStream>(stderr);
}

}  // namespace Varnel::Platform
