// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>

#include <cstddef>
#include <functional>
#include <thread>
#include <vector>

namespace Varnel::Tests {

/// A system call or, with flags, those of its uses that have one of them as the sixth argument.
struct ForbiddenCall {
  ForbiddenCall(unsigned theNumber, unsigned theFlags = 0) : number(theNumber), flags(theFlags) {}

  unsigned number;
  unsigned flags;
};

/// Does the work on a thread for which, and for those that it starts, the system calls fail: as on
/// a kernel without them (ENOSYS) or in a sandbox (EPERM).
inline void onAKernelThatForbids(const std::vector<ForbiddenCall>& calls, int failure,
                                 const std::function<void()>& work) {
  std::vector<sock_filter> steps{BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr))};
  for (const ForbiddenCall& call : calls) {
    const unsigned char length = call.flags == 0 ? 1 : 4;
    steps.push_back(BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, call.number, 0, length));
    if (call.flags != 0) {
      steps.push_back(BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, args[5])));
      steps.push_back(BPF_JUMP(BPF_JMP | BPF_JSET | BPF_K, call.flags, 1, 0));
      steps.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
    }
    steps.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | static_cast<unsigned>(failure)));
  }
  steps.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
  const sock_fprog program{.len = static_cast<unsigned short>(steps.size()),
                           .filter = steps.data()};
  std::thread([&] {
    ASSERT_EQ(::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0), 0);
    ASSERT_EQ(::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &program), 0);
    work();
  }).join();
}

}  // namespace Varnel::Tests
