// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TimeZones.h>

#include <gtest/gtest.h>
#include <time.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <limits>
#include <string>
#include <vector>

#include <Tests/Support/TemporaryFolder.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Text/DateFormatter.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono;
using namespace std::chrono_literals;

const auto system = Linux::makeTimeZones();

// All that the system has a file for, and rules that need none.
std::vector<std::string> identifiers() {
  std::vector<std::string> all = {"CET-1CEST,M3.5.0,M10.5.0/3", "<-03>3",
                                  "NZST-12NZDT,M9.5.0,M4.1.0/3", "EST5EDT4,M3.2.0/1:30,M11.1.0"};
  const fs::path folder = "/usr/share/zoneinfo";
  std::error_code failure;
  for (const auto& entry : fs::recursive_directory_iterator(folder, failure)) {
    const std::string name = entry.path().lexically_relative(folder);
    if (entry.is_symlink() || !entry.is_regular_file() || name.starts_with("posix/") ||
        name.starts_with("right/"))
      continue;
    std::string kind(4, ' ');
    std::ifstream(entry.path()).read(kind.data(), 4);
    if (kind == "TZif") all.push_back(name);
  }
  return all;
}

// The C library's answer for the zone that TZ names.
seconds offsetByLibrary(Date date) {
  const time_t time = floor<seconds>(date).time_since_epoch().count();
  tm local{};
  ::localtime_r(&time, &local);
  return seconds(local.tm_gmtoff);
}

std::vector<sys_seconds> changesOf(const TimeZone& zone, Date begin, Date end) {
  std::vector<sys_seconds> changes;
  for (auto change = zone.nextChange(begin); change && *change < end;
       change = zone.nextChange(*change))
    changes.push_back(floor<seconds>(*change));
  return changes;
}

// Beyond 2037 the library under the adapter misreads the one zone whose winter is the exception.
constexpr Date begin = sys_days(1970y / January / 1);
constexpr Date end = sys_days(2037y / December / 31);

TEST(TimeZones, EveryZoneOfTheSystemHasTheOffsetsThatTheCLibraryHas) {
  const auto all = identifiers();
  if (all.size() < 100) GTEST_SKIP() << "The system has no table of time zones.";
  for (const std::string& identifier : all) {
    const Tests::LocalZone local(identifier.c_str());
    ASSERT_EQ(system->localIdentifier(), identifier);
    const auto zone = system->zone(identifier);
    const auto changes = changesOf(*zone, begin, end);
    for (const sys_seconds change : changes)
      for (const sys_seconds time : {change - 1s, change})
        ASSERT_EQ(zone->offsetAt(time).fromUTC, offsetByLibrary(time))
            << identifier << time.time_since_epoch().count();
    // Between changes nothing happens, and none is missing.
    for (Date time = begin; time < end; time += days(23)) {
      ASSERT_EQ(zone->offsetAt(time).fromUTC, offsetByLibrary(time)) << identifier;
      const auto next = zone->nextChange(time);
      const auto expected = std::upper_bound(changes.begin(), changes.end(), time);
      if (expected != changes.end()) {
        ASSERT_EQ(next, *expected) << identifier;
      }
    }
  }
}

TEST(TimeZones, TakeEveryFormOfTheVariableAndAnythingElseForUTC) {
  const Date summer = sys_days(2026y / July / 1) + 12h;
  const struct {
    const char* variable;
    const char* identifier;
    const char* text;
  } rows[] = {
      {"CET-1CEST,M3.5.0,M10.5.0/3", "CET-1CEST,M3.5.0,M10.5.0/3", "14:00 +02:00"},
      {"Europe/Berlin", "Europe/Berlin", "14:00 +02:00"},
      {":Europe/Berlin", "Europe/Berlin", "14:00 +02:00"},
      {"/usr/share/zoneinfo/Europe/Berlin", "/usr/share/zoneinfo/Europe/Berlin", "14:00 +02:00"},
      {"America/Mexico_City", "America/Mexico_City", "06:00 -06:00"},
      {":", "UTC", "12:00 Z"},
      {"/usr/share/zoneinfo", "UTC", "12:00 Z"},
      {"/dev/zero", "UTC", "12:00 Z"},
      {"../../../dev/zero", "UTC", "12:00 Z"},
  };
  for (const auto& row : rows) {
    const Tests::LocalZone local(row.variable);
    EXPECT_EQ(system->localIdentifier(), row.identifier) << row.variable;
    EXPECT_EQ(DateFormatter("HH:mm XXX", "en_US", *system).string(summer), row.text)
        << row.variable;
  }
  const Tests::LocalZone newYork("America/New_York");
  EXPECT_EQ(DateFormatter("z VV", "en_US", *system).string(summer), "EDT America/New_York");
  EXPECT_EQ(DateFormatter("z", "en_US", *system).string(summer + days(183)), "EST");
  const auto berlin = system->zone("Europe/Berlin");
  EXPECT_GT(berlin->nextChange(Date::min()), sys_days(1800y / January / 1));
}

TEST(TimeZones, ADamagedFileIsNoZone) {
  const fs::path whole = "/usr/share/zoneinfo/Europe/Berlin";
  const std::string bytes = readFile(whole).valueOr("");
  if (bytes.empty()) GTEST_SKIP() << "The system has no table of time zones.";
  const Tests::TemporaryFolder folder;
  const auto offsetWith = [&](const std::string& damaged) {
    return system->zone(folder.write("zone", damaged))->offsetAt(sys_days(2026y / July / 1));
  };
  EXPECT_EQ(offsetWith(bytes).fromUTC, 2h);
  for (std::size_t size = 0; size < bytes.size(); size += 7)
    ASSERT_EQ(offsetWith(bytes.substr(0, size)).fromUTC, 0s) << size;
  // What a changed byte means is open, and GLib itself complains of rules that it cannot read.
  const std::size_t rules = bytes.rfind('\n', bytes.size() - 2);
  for (std::size_t at = 0; at < rules; at += 3) {
    std::string changed = bytes;
    changed[at] = static_cast<char>(~changed[at]);
    EXPECT_LT(offsetWith(changed).fromUTC.count(), std::numeric_limits<std::int32_t>::max()) << at;
  }
}

TEST(TimeZones, FindWhereTheUserIsAsTheSystemWasSetUp) {
  const fs::path berlin = "/usr/share/zoneinfo/Europe/Berlin";
  if (!fs::exists(berlin)) GTEST_SKIP() << "The system has no table of time zones.";
  const Tests::TemporaryFolder root;
  const fs::path localTime = root.path() / "etc/localtime";
  const auto found = Linux::makeTimeZones(root.path());
  fs::create_directory(localTime.parent_path());
  EXPECT_EQ(found->localIdentifier(), "UTC");
  for (const fs::path& target : {berlin, berlin.lexically_relative(localTime.parent_path())}) {
    fs::create_symlink(target, localTime);
    EXPECT_EQ(found->localIdentifier(), "Europe/Berlin");
    fs::remove(localTime);
  }
  // A copy, as a container has that of its host; the name may still be the container's.
  fs::copy_file(berlin, localTime);
  EXPECT_EQ(found->localIdentifier(), localTime);
  root.write("etc/timezone", "Etc/UTC\n");
  EXPECT_EQ(found->localIdentifier(), localTime);
  EXPECT_EQ(found->zone(localTime)->offsetAt(sys_days(2026y / July / 1)).fromUTC, 2h);
  root.write("etc/timezone", "Europe/Berlin\n");
  EXPECT_EQ(found->localIdentifier(), "Europe/Berlin");
}

}  // namespace
}  // namespace Varnel::Platform
