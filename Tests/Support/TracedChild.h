// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/ptrace.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <functional>
#include <string>

namespace Varnel::Tests {

/// Does the work in a process of its own, which waits before each of its system calls: `before` is
/// told how many there were, and the call, and may change the world; false kills the process there.
/// Returns whether it came to its end; where this machine lets nobody trace, it does not begin. To
/// be called while this process has one thread.
inline bool inTracedChild(const std::function<void()>& work,
                          const std::function<bool(unsigned, std::uint64_t)>& before) {
  constexpr int untraced = 77;
  const pid_t child = ::fork();
  if (child == 0) {
    if (::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0) ::_exit(untraced);
    ::raise(SIGSTOP);
    work();
    ::_exit(testing::Test::HasFailure() ? 1 : 0);
  }
  unsigned calls = 0;
  int status = 0;
  ::waitpid(child, &status, 0);
  ::ptrace(PTRACE_SETOPTIONS, child, nullptr, PTRACE_O_TRACESYSGOOD | PTRACE_O_EXITKILL);
  while (WIFSTOPPED(status)) {
    __ptrace_syscall_info facts{};
    const bool isCall = WSTOPSIG(status) == (SIGTRAP | 0x80) &&
                        ::ptrace(PTRACE_GET_SYSCALL_INFO, child, sizeof facts, &facts) > 0 &&
                        facts.op == PTRACE_SYSCALL_INFO_ENTRY;
    if (isCall && !before(++calls, facts.entry.nr)) ::kill(child, SIGKILL);
    ::ptrace(PTRACE_SYSCALL, child, nullptr, 0);
    if (::waitpid(child, &status, 0) != child) return false;
  }
  const int answer = WIFEXITED(status) ? WEXITSTATUS(status) : untraced;
  EXPECT_TRUE(answer == 0 || answer == untraced) << "in the traced process";
  return answer != untraced;
}

/// Why this machine cannot trace, or nothing.
inline std::string whyNotTraced() {
  unsigned calls = 0;
  const bool isDone = inTracedChild([] { static_cast<void>(::getppid()); },
                                    [&](unsigned, std::uint64_t) { return ++calls > 0; });
  return isDone && calls > 0 ? "" : "no process may be traced here";
}

}  // namespace Varnel::Tests
