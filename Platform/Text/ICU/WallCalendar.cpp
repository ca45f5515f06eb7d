// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/ICU/WallCalendar.h>

#include <unicode/calendar.h>
#include <unicode/ucal.h>
#include <unicode/uenum.h>
#include <unicode/uloc.h>

#include <array>
#include <cmath>
#include <string_view>

namespace Varnel::Platform::ICU {
namespace {

// How far a calculation may lead; `Date` reaches 292,000 years.
constexpr double maxMilliseconds = 9.0e15;

constexpr std::string_view gregorian = "gregorian";

class Calendar final : public LocaleLibrary::WallCalendar {
 public:
  explicit Calendar(std::unique_ptr<const icu::Calendar> prototype)
      : prototype_(std::move(prototype)) {}

  std::optional<Time> adding(std::int32_t years, std::int32_t months, std::int32_t days,
                             Time time) const override {
    const std::unique_ptr<icu::Calendar> calendar(prototype_->clone());
    if (!calendar) return std::nullopt;
    UErrorCode status = U_ZERO_ERROR;
    calendar->setTime(static_cast<UDate>(time.time_since_epoch().count()), status);
    calendar->add(UCAL_YEAR, years, status);
    calendar->add(UCAL_MONTH, months, status);
    calendar->add(UCAL_DATE, days, status);
    const UDate sum = calendar->getTime(status);
    if (U_FAILURE(status) || !(std::abs(sum) <= maxMilliseconds)) return std::nullopt;
    return Time(std::chrono::milliseconds(static_cast<std::int64_t>(sum)));
  }

  int weekdayCount() const override {
    return prototype_->getMaximum(UCAL_DAY_OF_WEEK) - prototype_->getMinimum(UCAL_DAY_OF_WEEK) + 1;
  }

 private:
  const std::unique_ptr<const icu::Calendar> prototype_;  // Cloned for each calculation.
};

}  // namespace

// A calendar would tell, too, but reads much before.
bool hasGregorianCalendar(const std::string& locale) {
  UErrorCode status = U_ZERO_ERROR;
  std::array<char, ULOC_KEYWORDS_CAPACITY> named{};
  uloc_getKeywordValue(locale.c_str(), "calendar", named.data(), ULOC_KEYWORDS_CAPACITY, &status);
  if (U_SUCCESS(status) && named.front() != 0) return std::string_view(named.data()) == gregorian;
  status = U_ZERO_ERROR;
  const icu::LocalUEnumerationPointer used(
      ucal_getKeywordValuesForLocale("calendar", locale.c_str(), true, &status));
  const char* first = U_SUCCESS(status) ? uenum_next(used.getAlias(), nullptr, &status) : nullptr;
  return first && U_SUCCESS(status) && first == gregorian;
}

std::unique_ptr<LocaleLibrary::WallCalendar> makeWallCalendar(const std::string& locale) {
  UErrorCode status = U_ZERO_ERROR;
  std::unique_ptr<const icu::Calendar> calendar(
      icu::Calendar::createInstance(*icu::TimeZone::getGMT(), icu::Locale(locale.c_str()), status));
  if (U_FAILURE(status)) return nullptr;
  return std::make_unique<Calendar>(std::move(calendar));
}

}  // namespace Varnel::Platform::ICU
