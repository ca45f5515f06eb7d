// SPDX-License-Identifier: MIT
#pragma once

#include <stdlib.h>
#include <time.h>

namespace Varnel::Tests {

/// The process's time zone as TZ has it, until the object goes.
class LocalZone final {
 public:
  explicit LocalZone(const char* variable) {
    ::setenv("TZ", variable, 1);
    ::tzset();
  }
  ~LocalZone() {
    ::unsetenv("TZ");
    ::tzset();
  }
  LocalZone(const LocalZone&) = delete;
  LocalZone& operator=(const LocalZone&) = delete;
};

}  // namespace Varnel::Tests
