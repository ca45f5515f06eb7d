// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/ICU/DatePattern.h>

#include <unicode/simpletz.h>
#include <unicode/smpdtfmt.h>

#include <algorithm>
#include <cstdint>

#include <Varnel/Platform/Ports/TimeZones.h>

namespace Varnel::Platform::ICU {
namespace {

UDate icuDate(Date date) {
  const auto milliseconds = std::chrono::floor<std::chrono::milliseconds>(date);
  return static_cast<UDate>(milliseconds.time_since_epoch().count());
}

// The library's own rules of a zone may be older than the system's. So it is given the system's
// offsets, and uses the identifier only for the zone's names.
class SystemZone final : public icu::SimpleTimeZone {
 public:
  SystemZone(const std::string& identifier, std::shared_ptr<const Platform::TimeZone> zone)
      : SimpleTimeZone(0, icu::UnicodeString::fromUTF8(identifier)), zone_(std::move(zone)) {}

  using SimpleTimeZone::getOffset;

  SystemZone* clone() const override { return new SystemZone(*this); }

  void getOffset(UDate date, UBool, std::int32_t& standard, std::int32_t& saving,
                 UErrorCode&) const override {
    const Platform::TimeZone::Offset offset = offsetAt(date);
    // The sum is right even where daylight saving advances the clocks by something other than an
    // hour.
    saving = offset.isDaylightSaving ? U_MILLIS_PER_HOUR : 0;
    standard = static_cast<std::int32_t>(milliseconds(offset.fromUTC).count()) - saving;
  }

  UBool inDaylightTime(UDate date, UErrorCode&) const override {
    return offsetAt(date).isDaylightSaving;
  }

 private:
  using milliseconds = std::chrono::milliseconds;

  Platform::TimeZone::Offset offsetAt(UDate date) const {
    // `Date` ends somewhat later, but not at a number that floating point represents.
    constexpr UDate maxDate = 9.2e15;
    const UDate near = std::clamp(date, -maxDate, maxDate);
    return zone_->offsetAt(Date(milliseconds(static_cast<std::int64_t>(near))));
  }

  std::shared_ptr<const Platform::TimeZone> zone_;
};

class Pattern final : public LocaleLibrary::DatePattern {
 public:
  Pattern(const std::string& pattern, const icu::Locale& locale, UErrorCode& status)
      : format_(icu::UnicodeString::fromUTF8(pattern), locale, status) {
    icu::UnicodeString sample;
    if (U_SUCCESS(status)) format_.format(UDate(0), sample, nullptr, status);
  }

  void setZone(std::unique_ptr<icu::TimeZone> zone) { format_.adoptTimeZone(zone.release()); }

  // Formatting works on a copy of the calendar and changes nothing else.
  std::string text(Date date) const override {
    icu::UnicodeString characters;
    std::string text;
    return format_.format(icuDate(date), characters).toUTF8String(text);
  }

 private:
  icu::SimpleDateFormat format_;
};

}  // namespace

std::unique_ptr<LocaleLibrary::DatePattern> makeDatePattern(std::string_view pattern,
                                                            const std::string& locale,
                                                            const std::string& zoneIdentifier,
                                                            std::shared_ptr<const TimeZone> zone) {
  UErrorCode status = U_ZERO_ERROR;
  auto made = std::make_unique<Pattern>(std::string(pattern), icu::Locale(locale.c_str()), status);
  if (U_FAILURE(status)) return nullptr;
  made->setZone(std::make_unique<SystemZone>(zoneIdentifier, std::move(zone)));
  return made;
}

}  // namespace Varnel::Platform::ICU
