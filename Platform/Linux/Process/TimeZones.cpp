// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TimeZones.h>

#include <glib.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string_view>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using ZoneHandle = UniqueHandle<GTimeZone*, g_time_zone_unref>;

std::int64_t secondsOf(Date date) {
  return std::chrono::floor<std::chrono::seconds>(date).time_since_epoch().count();
}

// GLib reads two rules otherwise than the C library does: days of the year that do not count the
// leap day ("J60"), which no zone has, and from 2038 on a winter that is the exception, which
// Dublin has.
class GLibTimeZone final : public TimeZone {
 public:
  explicit GLibTimeZone(ZoneHandle zone) : zone_(std::move(zone)) {}

  Offset offsetAt(Date date) const override {
    const int interval = intervalAt(secondsOf(date));
    return {.fromUTC = std::chrono::seconds(g_time_zone_get_offset(zone_.get(), interval)),
            .isDaylightSaving = g_time_zone_is_dst(zone_.get(), interval) != 0};
  }

  // GLib numbers the intervals between changes, but does not tell where they end.
  std::optional<Date> nextChange(Date date) const override {
    std::int64_t before = secondsOf(date);
    const int interval = intervalAt(before);
    if (intervalAt(secondsOf(Date::max())) == interval) return std::nullopt;
    std::int64_t step = 24 * 60 * 60;
    for (; intervalAt(before + step) == interval; step *= 2) before += step;
    for (; step > 1; step -= step / 2)
      if (intervalAt(before + step / 2) == interval) before += step / 2;
    return Date(std::chrono::seconds(before + 1));
  }

 private:
  int intervalAt(std::int64_t second) const {
    return g_time_zone_find_interval(zone_.get(), G_TIME_TYPE_UNIVERSAL, second);
  }

  const ZoneHandle zone_;
};

// Null for what names no zone. Names stand below the system's folder of zones; a path may lead to
// a zone of the user's own, but not to what blocks whoever opens it.
ZoneHandle loadZone(const std::string& identifier) {
  namespace fs = std::filesystem;
  const bool isPath = identifier.starts_with('/') || identifier.find("..") != std::string::npos;
  std::error_code failure;
  if (identifier.empty() || (isPath && !fs::is_regular_file(identifier, failure))) return {};
  return ZoneHandle(g_time_zone_new_identifier(identifier.c_str()));
}

class GLibTimeZones final : public TimeZones {
 public:
  // TZ, or where /etc/localtime leads to.
  std::string localIdentifier() const override {
    if (const char* variable = std::getenv("TZ")) {
      std::string name = variable;
      if (name.starts_with(':')) name.erase(0, 1);
      return loadZone(name) ? name : "UTC";
    }
    const ZoneHandle zone(g_time_zone_new_local());
    return g_time_zone_get_identifier(zone.get());
  }

  std::shared_ptr<const TimeZone> zone(const std::string& identifier) const override {
    ZoneHandle zone = loadZone(identifier);
    if (!zone) zone = ZoneHandle(g_time_zone_new_utc());
    return std::make_shared<GLibTimeZone>(std::move(zone));
  }
};

}  // namespace

std::unique_ptr<TimeZones> makeTimeZones() {
  return std::make_unique<GLibTimeZones>();
}

}  // namespace Varnel::Platform::Linux
