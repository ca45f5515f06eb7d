// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/ICU/Module.h>

#include <unicode/numberformatter.h>
#include <unicode/uchar.h>

#include <Varnel/Platform/Text/ICU/DatePattern.h>
#include <Varnel/Platform/Text/ICU/WallCalendar.h>
#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform::ICU {
namespace {

// What stands between the digits of "1,000.5".
LocaleLibrary::Separators separatorsOf(const icu::Locale& locale) {
  UErrorCode status = U_ZERO_ERROR;
  const icu::UnicodeString sample = icu::number::NumberFormatter::withLocale(locale)
                                        .formatDouble(1000.5, status)
                                        .toString(status);
  icu::UnicodeString grouping;
  icu::UnicodeString decimal;
  int digits = 0;
  for (std::int32_t at = 0; at < sample.length(); at = sample.moveIndex32(at, 1)) {
    const UChar32 character = sample.char32At(at);
    if (u_isdigit(character))
      ++digits;
    else if (digits == 1)
      grouping.append(character);
    else if (digits == 4)
      decimal.append(character);
  }
  LocaleLibrary::Separators separators;
  grouping.toUTF8String(separators.grouping);
  if (!decimal.isEmpty()) separators.decimal.clear();
  decimal.toUTF8String(separators.decimal);
  return separators;
}

class Library final : public LocaleLibrary {
 public:
  std::unique_ptr<DatePattern> datePattern(std::string_view pattern, const std::string& locale,
                                           const std::string& zoneIdentifier,
                                           std::shared_ptr<const TimeZone> zone) const override {
    return makeDatePattern(pattern, locale, zoneIdentifier, std::move(zone));
  }
  bool isGregorian(const std::string& locale) const override {
    return hasGregorianCalendar(locale);
  }
  std::unique_ptr<WallCalendar> wallCalendar(const std::string& locale) const override {
    return makeWallCalendar(locale);
  }
  Separators separators(const std::string& locale) const override {
    return separatorsOf(icu::Locale(locale.c_str()));
  }
};

}  // namespace
}  // namespace Varnel::Platform::ICU

const Varnel::Platform::LocaleLibrary* varnelLocaleLibrary() {
  static const auto& library = *new Varnel::Platform::ICU::Library;
  return &library;
}
