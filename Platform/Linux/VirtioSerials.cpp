// SPDX-License-Identifier: MIT
#include <Platform/Linux/VirtioSerials.h>

#include <utility>

namespace Varnel::Platform::Linux {

std::string VirtioSerials::of(const std::string& sequence,
                              const std::function<std::string()>& ask) {
  if (sequence.empty()) return ask();
  {
    const std::lock_guard lock(mutex_);
    if (const auto known = bySequence_.find(sequence); known != bySequence_.end())
      return known->second;
  }
  std::string serial = ask();
  const std::lock_guard lock(mutex_);
  return bySequence_.emplace(sequence, std::move(serial)).first->second;
}

}  // namespace Varnel::Platform::Linux
