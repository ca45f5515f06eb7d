// SPDX-License-Identifier: MIT
#pragma once

#include <pthread.h>
#include <signal.h>

#include <cerrno>
#include <ctime>

namespace Varnel::Platform::POSIX {

/// While it lives, what would bring the calling thread this signal only fails: a write to a pipe
/// without a reader (SIGPIPE), or beyond the limit of file sizes (SIGXFSZ). Such a signal goes to
/// the writing thread, and is consumed here whatever the process does with signals.
///
///     SuppressedSignal brokenPipe(SIGPIPE);
///     if (::write(file, bytes, size) < 0 && errno == EPIPE) brokenPipe.consume();
class SuppressedSignal final {
 public:
  explicit SuppressedSignal(int signal) : signal_(signal) {
    ::sigemptyset(&signals_);
    ::sigaddset(&signals_, signal_);
    ::pthread_sigmask(SIG_BLOCK, &signals_, &before_);
    wasBlocked_ = ::sigismember(&before_, signal_) == 1;
    // A signal that is not blocked does not stay pending.
    wasPending_ = wasBlocked_ && isPending();
  }
  ~SuppressedSignal() {
    if (!wasBlocked_) ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
  }
  SuppressedSignal(const SuppressedSignal&) = delete;
  SuppressedSignal& operator=(const SuppressedSignal&) = delete;

  /// To be called after a write that may have brought the signal.
  void consume() {
    constexpr timespec atOnce{};
    if (!wasPending_)
      while (::sigtimedwait(&signals_, nullptr, &atOnce) < 0 && errno == EINTR) continue;
  }

 private:
  bool isPending() const {
    sigset_t pending;
    ::sigpending(&pending);
    return ::sigismember(&pending, signal_) == 1;
  }

  const int signal_;
  sigset_t signals_;
  sigset_t before_;
  bool wasBlocked_ = false;
  bool wasPending_ = false;
};

}  // namespace Varnel::Platform::POSIX
