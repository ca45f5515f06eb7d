// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>
#include <string>

namespace Varnel::Tests {

/// The proxies that the environment names while this object lives.
class Proxies final {
 public:
  explicit Proxies(const std::string& address) {
    for (const char* name : names) ::setenv(name, address.c_str(), 1);
    for (const char* name : {"no_proxy", "NO_PROXY"}) ::unsetenv(name);
  }
  ~Proxies() {
    for (const char* name : names) ::unsetenv(name);
  }
  Proxies(const Proxies&) = delete;
  Proxies& operator=(const Proxies&) = delete;

 private:
  static constexpr const char* names[] = {"http_proxy", "https_proxy", "all_proxy"};
};

}  // namespace Varnel::Tests
