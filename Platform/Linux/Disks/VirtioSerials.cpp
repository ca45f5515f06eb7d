// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/VirtioSerials.h>

#include <future>
#include <memory>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Varnel::Platform::Linux {
namespace {

std::string answerWithin(std::chrono::milliseconds patience, std::function<std::string()> ask) {
  const auto task = std::make_shared<std::packaged_task<std::string()>>(std::move(ask));
  auto answer = task->get_future();
  try {
    startThread("virtio-serial", [task] { (*task)(); }).detach();
  } catch (const std::system_error&) {
    return {};
  }
  return answer.wait_for(patience) == std::future_status::ready ? answer.get() : std::string();
}

}  // namespace

std::string VirtioSerials::of(const std::string& disk, std::function<std::string()> ask) {
  {
    const std::lock_guard lock(mutex_);
    if (const auto known = byDisk_.find(disk); known != byDisk_.end()) return known->second;
  }
  std::string serial = answerWithin(patience_, std::move(ask));
  const std::lock_guard lock(mutex_);
  return byDisk_.emplace(disk, std::move(serial)).first->second;
}

}  // namespace Varnel::Platform::Linux
