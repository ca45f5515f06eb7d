// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <gmock/gmock.h>

#include <Tests/Support/Zones.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;

TEST_P(TimeZonesContract, ClocksChangeAtTheMomentOfTheChangeAndBehindItLiesTheNext) {
  const Date newYear = sys_days(2026y / January / 1);
  const Date lastDay = sys_days(2026y / December / 31);
  const struct {
    const char* zone;
    seconds winter, summer;
    Date begin, end;  // Of summer.
  } rows[] = {{"Europe/Berlin", 1h, 2h, sys_days(2026y / March / 29) + 1h,
               sys_days(2026y / October / 25) + 1h},
              {"America/New_York", -5h, -4h, sys_days(2026y / March / 8) + 7h,
               sys_days(2026y / November / 1) + 6h}};
  for (const auto& row : rows) {
    const auto zone = world->zones().zone(row.zone);
    const TimeZone::Offset winter{row.winter, false};
    const TimeZone::Offset summer{row.summer, true};
    EXPECT_EQ(zone->offsetAt(newYear), winter);
    EXPECT_EQ(zone->nextChange(newYear), row.begin);
    EXPECT_EQ(zone->nextChange(row.begin - 1us), row.begin);
    EXPECT_EQ(zone->offsetAt(row.begin - 1us), winter);
    EXPECT_EQ(zone->offsetAt(row.begin), summer);
    EXPECT_EQ(zone->nextChange(row.begin), row.end);
    EXPECT_EQ(zone->offsetAt(row.end - 1us), summer);
    EXPECT_EQ(zone->offsetAt(lastDay), winter);
    EXPECT_EQ(zone->nextChange(Date::max()), std::nullopt);
    for (const Date edge : {Date::min(), Date::max()}) EXPECT_LT(zone->offsetAt(edge).fromUTC, 24h);
  }
  const auto tokyo = world->zones().zone("Asia/Tokyo");
  EXPECT_EQ(tokyo->offsetAt(newYear), TimeZone::Offset{9h});
  EXPECT_EQ(tokyo->nextChange(newYear), std::nullopt);
}

TEST_P(TimeZonesContract, TheUserIsInAZoneThatIsKnownOrInUTC) {
  const TimeZones& zones = world->zones();
  for (const char* zone : {"Asia/Tokyo", "Europe/Berlin"}) {
    world->moveUser(zone);
    EXPECT_EQ(zones.localIdentifier(), zone);
  }
  for (const char* unknown : {"Nowhere/At_All", ""}) {
    world->moveUser(unknown);
    EXPECT_EQ(zones.localIdentifier(), "UTC") << unknown;
    const auto zone = zones.zone(unknown);
    EXPECT_EQ(zone->offsetAt(sys_days(2026y / July / 1)), TimeZone::Offset());
    EXPECT_EQ(zone->nextChange(Date::min()), std::nullopt);
  }
}

class FakeWorld final : public TimeZonesWorld {
 public:
  TimeZones& zones() override { return zones_; }
  void moveUser(const std::string& zone) override { zones_.local = zone; }

 private:
  Testing::FakeTimeZones zones_ = Tests::zonesOf2026();
};

INSTANTIATE_TEST_SUITE_P(Fake, TimeZonesContract, TimeZonesContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
