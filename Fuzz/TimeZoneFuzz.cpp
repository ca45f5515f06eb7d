// SPDX-License-Identifier: MIT
// The texts that TZ may hold, and files of zones. Until the next change the offset stays.
#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/TimeZones.h>

// GLib forgets to free the name of a zone whose rule it refuses.
extern "C" const char* __lsan_default_suppressions() {
  return "leak:g_time_zone_new_identifier";
}
extern "C" const char* __asan_default_options() {
  return "fast_unwind_on_malloc=0";
}

using namespace Varnel::Platform;
using namespace std::chrono_literals;

static void check(const TimeZone& zone, Date date) {
  const auto offset = zone.offsetAt(date);
  const auto change = zone.nextChange(date);
  if (!change) return;
  require(*change > date);
  require(zone.offsetAt(*change - 1s) == offset);
}

static void fuzz(std::string_view input) {
  static const auto folder = Varnel::Tests::TemporaryFolder::inMemory();
  static const auto zones = Linux::makeTimeZones();
  const bool isFile = input.starts_with("TZif");
  const std::string name = isFile ? folder.write("Zone", input).string() : std::string(input);
  const auto zone = zones->zone(name);
  for (const auto hours : {-1'000'000h, -1h, 0h, 300'000h, 497'000h, 600'000h, 5'000'000h})
    check(*zone, Date(hours));
}
