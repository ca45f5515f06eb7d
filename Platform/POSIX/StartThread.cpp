// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/StartThread.h>

#include <utility>

#include <Varnel/Platform/Concurrency/CurrentThread.h>
#include <Varnel/Platform/POSIX/BlockedSignals.h>

namespace Varnel::Platform {

std::thread startThread(std::string name, std::function<void()> body) {
  const POSIX::BlockedSignals inheritedByTheThread;
  return std::thread([name = std::move(name), body = std::move(body)] {
    nameCurrentThread(name);
    body();
  });
}

}  // namespace Varnel::Platform
