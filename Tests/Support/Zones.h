// SPDX-License-Identifier: MIT
#pragma once

#include <stdlib.h>
#include <time.h>

#include <string>
#include <utility>

#include <Varnel/Platform/Testing/FakeTimeZones.h>

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

/// Three zones as they are in 2026 and the first weeks of 2027, the user in the one named.
inline Platform::Testing::FakeTimeZones zonesOf2026(std::string local = "UTC") {
  using namespace std::chrono;
  using namespace std::chrono_literals;
  constexpr auto always = Platform::Date::min();
  Platform::Testing::FakeTimeZones zones;
  zones.local = std::move(local);
  zones.changes["Europe/Berlin"] = {{always, {1h}},
                                    {sys_days(2026y / March / 29) + 1h, {2h, true}},
                                    {sys_days(2026y / October / 25) + 1h, {1h}}};
  zones.changes["America/New_York"] = {{always, {-5h}},
                                       {sys_days(2026y / March / 8) + 7h, {-4h, true}},
                                       {sys_days(2026y / November / 1) + 6h, {-5h}}};
  zones.changes["Asia/Tokyo"] = {{always, {9h}}};
  return zones;
}

}  // namespace Varnel::Tests
