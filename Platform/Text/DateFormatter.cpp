// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/DateFormatter.h>

#include <fmt/chrono.h>

#include <array>
#include <atomic>
#include <cstdint>

#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Text/LocaleLibrary.h>

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

Second secondOf(Date date) {
  return std::chrono::floor<std::chrono::seconds>(date);
}

// Never given twice, unlike an address.
std::uint64_t nextIdentity() {
  static std::atomic<std::uint64_t> last = 0;
  return ++last;
}

constexpr std::string_view unitsBelowASecond = "SA";
constexpr std::string_view unitsBelowADay = "abBhHkKmsSA";

// Whether the pattern has one of the units outside quotes.
bool hasOneOf(std::string_view units, std::string_view pattern) {
  bool isQuoted = false;
  for (const char character : pattern) {
    if (character == '\'') isQuoted = !isQuoted;
    if (!isQuoted && units.find(character) != std::string_view::npos) return true;
  }
  return false;
}

// For patterns that cannot be used, and without the library of locales.
std::string plainText(Date date, const TimeZone& zone, bool hasTime) {
  const auto second = std::chrono::floor<std::chrono::seconds>(date) + zone.offsetAt(date).fromUTC;
  return hasTime ? fmt::format("{:%F %T}", second) : fmt::format("{:%F}", second);
}

}  // namespace

struct DateFormatter::State {
  State(std::string_view pattern, const std::string& locale, const TimeZones& timeZones)
      : isCached(!hasOneOf(unitsBelowASecond, pattern)) {
    const std::string identifier = timeZones.localIdentifier();
    zone = timeZones.zone(identifier);
    if (const LocaleLibrary* library = localeLibrary())
      format = library->datePattern(pattern, locale, identifier, zone);
    else
      hasTime = hasOneOf(unitsBelowADay, pattern);  // The day's log is to be the day's.
  }

  [[nodiscard]] std::string compute(Date date) const {
    return format ? format->text(date) : plainText(date, *zone, hasTime);
  }

  /// The text that this thread has kept; empty for none.
  [[nodiscard]] std::string_view kept(Date date) const {
    const CachedText& cached = slot();
    if (!isCached || cached.formatter != identity || cached.second != secondOf(date)) return {};
    return {cached.characters.data(), cached.size};
  }

  void keep(Date date, std::string_view text) const {
    CachedText& cached = slot();
    if (!isCached || text.size() > cached.characters.size()) return;
    text.copy(cached.characters.data(), text.size());
    cached.formatter = identity;
    cached.second = secondOf(date);
    cached.size = text.size();
  }

  [[nodiscard]] CachedText& slot() const { return cachedTexts[identity % cachedTexts.size()]; }

  const std::uint64_t identity = nextIdentity();
  const bool isCached;
  bool hasTime = true;
  std::shared_ptr<const TimeZone> zone;
  std::unique_ptr<const LocaleLibrary::DatePattern> format;
};

DateFormatter::DateFormatter(std::string_view pattern, std::string_view localeIdentifier,
                             const TimeZones& timeZones)
    : state_(std::make_unique<State>(pattern, std::string(localeIdentifier), timeZones)) {}

DateFormatter::~DateFormatter() = default;

std::string DateFormatter::string(Date date) const {
  if (const std::string_view kept = state_->kept(date); !kept.empty()) return std::string(kept);
  std::string text = state_->compute(date);
  state_->keep(date, text);
  return text;
}

std::size_t DateFormatter::write(Date date, std::span<char> room) const {
  const std::string_view kept = state_->kept(date);
  const std::string made = kept.empty() ? string(date) : std::string();
  const std::string_view text = kept.empty() ? made : kept;
  return text.size() <= room.size() ? text.copy(room.data(), text.size()) : 0;
}

}  // namespace Varnel::Platform
