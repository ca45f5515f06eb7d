// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>
#include <vector>

#include <Varnel/Platform/Ports/CookieStorage.h>

namespace Varnel::Platform::Testing {

/// Cookie stores that the test fills. Set them before other threads read.
class FakeCookieStorage final : public CookieStorage {
 public:
  bool groups = true;
  std::vector<Cookie> own;
  std::map<std::string, std::vector<Cookie>> ofGroup;

  [[nodiscard]] bool hasGroupContainers() const override { return groups; }
  [[nodiscard]] std::vector<Cookie> cookies() override { return own; }
  [[nodiscard]] std::vector<Cookie> cookiesOfGroupContainer(
      const std::string& identifier) override {
    const auto found = ofGroup.find(identifier);
    return found == ofGroup.end() ? std::vector<Cookie>() : found->second;
  }
};

}  // namespace Varnel::Platform::Testing
