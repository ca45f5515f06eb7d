// SPDX-License-Identifier: MIT
#pragma once

#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <stdexcept>

namespace Varnel::Tests {

/// Another process, for what one alone cannot show: a lock held by somebody else, a writer at work.
/// It runs `prepare`, which tells whether all is set up; the constructor waits for that. It then
/// stays until the object goes. To be made while this process has one thread.
class OtherProcess final {
 public:
  template <typename Prepare>
  explicit OtherProcess(Prepare prepare) {
    std::array<int, 2> ends{};
    if (::socketpair(AF_UNIX, SOCK_STREAM, 0, ends.data()) != 0) throw std::runtime_error("socket");
    process_ = ::fork();
    char byte = 0;
    if (process_ == 0) {
      ::close(ends[0]);
      const auto kept = prepare();
      byte = kept ? 1 : 0;
      if (::write(ends[1], &byte, 1) == 1) static_cast<void>(::read(ends[1], &byte, 1));
      ::_exit(0);
    }
    ::close(ends[1]);
    leave_ = ends[0];
    isReady_ = ::read(leave_, &byte, 1) == 1 && byte == 1;
  }
  ~OtherProcess() {
    ::close(leave_);
    ::waitpid(process_, nullptr, 0);
  }
  OtherProcess(const OtherProcess&) = delete;
  OtherProcess& operator=(const OtherProcess&) = delete;

  [[nodiscard]] bool isReady() const { return isReady_; }

 private:
  pid_t process_ = -1;
  int leave_ = -1;
  bool isReady_ = false;
};

}  // namespace Varnel::Tests
