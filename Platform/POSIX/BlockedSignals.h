// SPDX-License-Identifier: MIT
#pragma once

#include <signal.h>

namespace Varnel::Platform::POSIX {

/// While it lives, the calling thread takes no signals of the process, and threads that it or a
/// library on it starts will never take any:
///
///     const POSIX::BlockedSignals blocked;
///     connection = libraryThatStartsThreads();
///
/// Signals of a thread's own faults are not blocked, so that the host's crash handler sees them.
class BlockedSignals final {
 public:
  BlockedSignals() {
    sigset_t signals;
    ::sigfillset(&signals);
    for (const int fault : {SIGBUS, SIGFPE, SIGILL, SIGSEGV, SIGSYS, SIGTRAP})
      ::sigdelset(&signals, fault);
    ::pthread_sigmask(SIG_BLOCK, &signals, &before_);
  }
  ~BlockedSignals() { ::pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
  BlockedSignals(const BlockedSignals&) = delete;
  BlockedSignals& operator=(const BlockedSignals&) = delete;

 private:
  sigset_t before_;
};

}  // namespace Varnel::Platform::POSIX
