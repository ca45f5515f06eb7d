// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include <Varnel/Platform/Ports/CookieStorage.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Cookie stores that the test fills. Set them before other threads read.
class FakeCookieStorage final : public CookieStorage {
 public:
  /// Readings. A store that goes wrong is empty.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  bool groups = true;
  std::vector<Cookie> own;
  std::map<std::string, std::vector<Cookie>> ofGroup;

  [[nodiscard]] bool hasGroupContainers() const override { return groups; }
  [[nodiscard]] std::vector<Cookie> cookies() override {
    return faults->strikes() ? std::vector<Cookie>() : own;
  }
  [[nodiscard]] std::vector<Cookie> cookiesOfGroupContainer(
      const std::string& identifier) override {
    if (faults->strikes()) return {};
    const auto found = ofGroup.find(identifier);
    return found == ofGroup.end() ? std::vector<Cookie>() : found->second;
  }
};

}  // namespace Varnel::Platform::Testing
