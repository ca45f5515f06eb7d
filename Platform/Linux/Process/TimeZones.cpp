// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TimeZones.h>

#include <glib.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <sstream>
#include <string>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/ZoneFile.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

using ZoneHandle = UniqueHandle<GTimeZone*, g_time_zone_unref>;

std::int64_t secondsOf(Date date) {
  return std::chrono::floor<std::chrono::seconds>(date).time_since_epoch().count();
}

// GLib reads two kinds of rules differently from the C library: days of the year without the leap
// day ("J60"), which no zone uses, and, from 2038 on, zones whose winter time is the exception, as
// in Dublin.
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
    std::int64_t step = std::chrono::seconds(std::chrono::days(1)).count();
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

fs::path folderOfZones() {
  const char* folder = std::getenv("TZDIR");
  return folder && *folder ? folder : "/usr/share/zoneinfo";
}

std::optional<std::string> contentOf(const fs::path& file) {
  std::error_code failure;
  // Opening anything but a plain file may block.
  if (!fs::is_regular_file(file, failure)) return std::nullopt;
  std::ostringstream content;
  content << std::ifstream(file, std::ios::binary).rdbuf();
  return std::move(content).str();
}

// Null for a text that names no zone. Names are looked up in the system's folder of zones; a path
// may lead to the user's own zone file.
ZoneHandle loadZone(const std::string& identifier) {
  if (identifier.empty()) return {};
  const auto content = contentOf(folderOfZones() / identifier);
  const bool isPath = identifier.starts_with('/') || identifier.find("..") != std::string::npos;
  // Without a file the text may be a rule.
  if (content ? !isWholeZoneFile(*content) : isPath) return {};
  return ZoneHandle(g_time_zone_new_identifier(identifier.c_str()));
}

class GLibTimeZones final : public TimeZones {
 public:
  explicit GLibTimeZones(const std::string& root) : localTime_(fs::path(root) / "etc/localtime") {}

  // TZ, or where /etc/localtime leads to.
  std::string localIdentifier() const override {
    std::string name = chosenName();
    return loadZone(name) ? name : "UTC";
  }

  std::shared_ptr<const TimeZone> zone(const std::string& identifier) const override {
    ZoneHandle zone = loadZone(identifier);
    if (!zone) zone = ZoneHandle(g_time_zone_new_utc());
    return std::make_shared<GLibTimeZone>(std::move(zone));
  }

 private:
  std::string chosenName() const {
    if (const char* variable = std::getenv("TZ")) return variable + (*variable == ':' ? 1 : 0);
    std::error_code isNoLink;
    const fs::path target = fs::read_symlink(localTime_, isNoLink);
    return isNoLink ? nameOfCopy() : nameOf((localTime_.parent_path() / target).lexically_normal());
  }

  static std::string nameOf(const fs::path& file) {
    const std::string name = file.lexically_relative(folderOfZones());
    return name.empty() || name.starts_with("..") ? file.string() : name;
  }

  // A container may have its host's zone and a name of its own, which counts if it names the same.
  std::string nameOfCopy() const {
    std::string name;
    std::getline(std::ifstream(localTime_.parent_path() / "timezone"), name);
    const auto named = name.empty() ? std::nullopt : contentOf(folderOfZones() / name);
    return named && named == contentOf(localTime_) ? name : localTime_.string();
  }

  const fs::path localTime_;
};

}  // namespace

std::unique_ptr<TimeZones> makeTimeZones(const std::string& root) {
  return std::make_unique<GLibTimeZones>(root);
}

}  // namespace Varnel::Platform::Linux
