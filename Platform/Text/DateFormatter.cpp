// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/DateFormatter.h>

#include <unicode/simpletz.h>
#include <unicode/smpdtfmt.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <mutex>

#include <Varnel/Platform/Ports/TimeZones.h>

namespace Varnel::Platform {
namespace {

using Second = std::chrono::sys_seconds;

/// The latest text of one formatter on one thread. It has no destructor, so that threads may still
/// write dates while they end.
struct CachedText {
  std::uint64_t formatter = 0;
  Second second{};
  std::size_t size = 0;
  std::array<char, 48> characters{};
};

// Formatters share a slot only when more than four are in use on one thread.
constinit thread_local std::array<CachedText, 4> cachedTexts{};

// Never given twice, unlike an address.
std::uint64_t nextIdentity() {
  static std::atomic<std::uint64_t> last = 0;
  return ++last;
}

// Whether the pattern has fractions of a second (S) or milliseconds of the day (A) outside quotes.
bool isFinerThanSeconds(std::string_view pattern) {
  bool isQuoted = false;
  for (const char character : pattern) {
    if (character == '\'') isQuoted = !isQuoted;
    if (!isQuoted && (character == 'S' || character == 'A')) return true;
  }
  return false;
}

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

using Format = std::unique_ptr<icu::SimpleDateFormat>;

// Null unless a date can be written with it.
Format makeFormat(std::string_view pattern, const icu::Locale& locale, const TimeZones& timeZones) {
  const icu::StringPiece bytes(pattern.data(), static_cast<std::int32_t>(pattern.size()));
  UErrorCode status = U_ZERO_ERROR;
  auto format =
      std::make_unique<icu::SimpleDateFormat>(icu::UnicodeString::fromUTF8(bytes), locale, status);
  icu::UnicodeString sample;
  if (U_SUCCESS(status)) format->format(UDate(0), sample, nullptr, status);
  if (U_FAILURE(status)) return nullptr;
  const std::string zone = timeZones.localIdentifier();
  format->adoptTimeZone(new SystemZone(zone, timeZones.zone(zone)));
  return format;
}

}  // namespace

struct DateFormatter::State {
  State(std::string_view pattern, const icu::Locale& locale, const TimeZones& timeZones)
      : isCached(!isFinerThanSeconds(pattern)), format(makeFormat(pattern, locale, timeZones)) {
    if (!format) format = makeFormat("yyyy-MM-dd HH:mm:ss", icu::Locale::getRoot(), timeZones);
  }

  [[nodiscard]] std::string compute(Date date) {
    std::string text;
    if (!format) return text;
    icu::UnicodeString characters;
    const std::lock_guard lock(mutex);
    format->format(icuDate(date), characters);
    return characters.toUTF8String(text);
  }

  const std::uint64_t identity = nextIdentity();
  const bool isCached;
  std::mutex mutex;  ///< Guards `format`.
  Format format;
};

DateFormatter::DateFormatter(std::string_view pattern, std::string_view localeIdentifier,
                             const TimeZones& timeZones)
    : state_(std::make_unique<State>(pattern, icu::Locale(std::string(localeIdentifier).c_str()),
                                     timeZones)) {}

DateFormatter::~DateFormatter() = default;

std::string DateFormatter::string(Date date) const {
  if (!state_->isCached) return state_->compute(date);
  const auto second = std::chrono::floor<std::chrono::seconds>(date);
  CachedText& cached = cachedTexts[state_->identity % cachedTexts.size()];
  if (cached.formatter == state_->identity && cached.second == second)
    return {cached.characters.data(), cached.size};

  std::string text = state_->compute(date);
  if (text.size() <= cached.characters.size()) {
    std::memcpy(cached.characters.data(), text.data(), text.size());
    cached.formatter = state_->identity;
    cached.second = second;
    cached.size = text.size();
  }
  return text;
}

}  // namespace Varnel::Platform
