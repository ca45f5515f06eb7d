// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>

#include <Varnel/Platform/Ports/Application.h>

namespace Varnel::Platform::Testing {

/// An application that is in front when the test says so. Any thread.
class FakeApplication final : public Application {
 public:
  [[nodiscard]] bool isActive() const override { return isActive_; }
  void setActive(bool isActive) override { isActive_ = isActive; }

 private:
  std::atomic<bool> isActive_ = false;
};

}  // namespace Varnel::Platform::Testing
