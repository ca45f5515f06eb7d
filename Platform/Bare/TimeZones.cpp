// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/TimeZones.h>

#include <unicode/basictz.h>
#include <unicode/tztrans.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Bare/Adapters.h>

namespace Varnel::Platform::Bare {
namespace {

using Handle = std::unique_ptr<icu::BasicTimeZone>;

// ICU counts in milliseconds, and not for ever.
double millisecondsOf(Date date) {
  using namespace std::chrono;
  constexpr Date first = sys_days(year(1) / January / 1);
  constexpr Date last = sys_days(year(9999) / December / 31);
  const auto time = floor<milliseconds>(std::clamp(date, first, last));
  return static_cast<double>(time.time_since_epoch().count());
}

class ICUTimeZone final : public TimeZone {
 public:
  explicit ICUTimeZone(Handle zone) : zone_(std::move(zone)) {}

  Offset offsetAt(Date date) const override {
    UErrorCode status = U_ZERO_ERROR;
    std::int32_t standard = 0;
    std::int32_t daylight = 0;
    zone_->getOffset(millisecondsOf(date), false, standard, daylight, status);
    if (U_FAILURE(status)) return {};
    return {.fromUTC = std::chrono::duration_cast<std::chrono::seconds>(
                std::chrono::milliseconds(standard + daylight)),
            .isDaylightSaving = daylight != 0};
  }

  std::optional<Date> nextChange(Date date) const override {
    icu::TimeZoneTransition change;
    if (!zone_->getNextTransition(millisecondsOf(date), false, change)) return std::nullopt;
    const Date next{std::chrono::milliseconds(static_cast<std::int64_t>(change.getTime()))};
    return next > date ? std::optional(next) : std::nullopt;
  }

 private:
  const Handle zone_;
};

// UTC for a text that names no zone.
Handle loadZone(const std::string& identifier) {
  const auto text = icu::UnicodeString::fromUTF8(identifier);
  return Handle(dynamic_cast<icu::BasicTimeZone*>(icu::TimeZone::createTimeZone(text)));
}

// TZ, or the name of the zone that /etc/localtime leads to.
std::string chosenName() {
  if (const char* variable = std::getenv("TZ")) return variable + (*variable == ':' ? 1 : 0);
  constexpr std::string_view folder = "/zoneinfo/";
  std::error_code isNoLink;
  const std::string target = std::filesystem::read_symlink("/etc/localtime", isNoLink).string();
  const std::size_t begin = target.find(folder);
  return begin == std::string::npos ? std::string() : target.substr(begin + folder.size());
}

class ICUTimeZones final : public TimeZones {
 public:
  std::string localIdentifier() const override {
    std::string name = chosenName();
    const Handle zone = loadZone(name);
    return zone && *zone != icu::TimeZone::getUnknown() ? name : "UTC";
  }

  std::shared_ptr<const TimeZone> zone(const std::string& identifier) const override {
    Handle zone = loadZone(identifier);
    if (!zone) zone = loadZone("UTC");
    return std::make_shared<ICUTimeZone>(std::move(zone));
  }
};

}  // namespace

std::unique_ptr<TimeZones> makeTimeZones() {
  return std::make_unique<ICUTimeZones>();
}

}  // namespace Varnel::Platform::Bare
