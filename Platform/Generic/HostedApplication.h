// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>

#include <Varnel/Platform/Ports/Application.h>

namespace Varnel::Platform {

/// An application whose host alone knows whether it is in front. Any thread.
class HostedApplication final : public Application {
 public:
  [[nodiscard]] bool isActive() const override { return isActive_; }
  void setActive(bool isActive) override { isActive_ = isActive; }

 private:
  std::atomic<bool> isActive_ = false;
};

}  // namespace Varnel::Platform
