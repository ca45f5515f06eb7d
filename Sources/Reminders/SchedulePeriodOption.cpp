// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulePeriodOption.h>

#include <string_view>

#include <Varnel/Basalt/Assertions.h>
#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Text/Calendar.h>

namespace Varnel {
namespace {

struct Names {
  std::string_view kind;
  std::string_view analyticsIdentifier;
  std::string_view textKey;
};

// By raw value.
constexpr std::array<Names, 7> names{{
    {"never", "Never", "Never"},
    {"weekly", "Weekly", "Weekly"},
    {"onceInTwoWeeks", "Once in Two Weeks", "Once In Two Weeks"},
    {"monthly", "Monthly", "Monthly"},
    {"onceInThreeMonths", "Once in Three Months", "Once In Three Months"},
    {"onceInSixMonths", "Once in Six Months", "Once In Six Months"},
    {"annually", "Annually", "Annually"},
}};

constexpr std::string_view kindKey = "kind";
constexpr std::string_view defaultKind = "default";
constexpr int yearsOfNever = 1000;

const Names& namesOf(SchedulePeriodOption option) {
  return names.at(static_cast<std::size_t>(option.rawValue()));
}

SchedulePeriodOption optionOfKind(const std::string& kind) {
  for (const SchedulePeriodOption option : SchedulePeriodOption::optionsAvailableToUser())
    if (kind == namesOf(option).kind) return option;
  if (kind == defaultKind) return SchedulePeriodOption::default_();
  throw Basalt::JSONError::withMessage("Unable to import SchedulePeriodOption of kind " + kind);
}

std::int64_t daysOfWeek(const Platform::Calendar& calendar) {
  const auto count = calendar.weekdayCount();
  if (!count) Basalt::assertUnreachable(__FILE__, __LINE__);
  return *count;
}

}  // namespace

std::optional<SchedulePeriodOption> SchedulePeriodOption::withRawValue(std::int64_t rawValue) {
  for (const SchedulePeriodOption option : optionsAvailableToUser())
    if (option.rawValue() == rawValue) return option;
  return std::nullopt;
}

SchedulePeriodOption::SchedulePeriodOption(const Basalt::JSON& jsonObject)
    : SchedulePeriodOption(
          optionOfKind(Basalt::importString(jsonObject, kindKey, "SchedulePeriodOption"))) {}

SchedulePeriodOption SchedulePeriodOption::default_() {
  return Globals::isMarkettaVersion() ? never : onceInTwoWeeks;
}

const std::array<SchedulePeriodOption, 7>& SchedulePeriodOption::optionsAvailableToUser() {
  static constexpr std::array<SchedulePeriodOption, 7> all{
      never, weekly, onceInTwoWeeks, monthly, onceInThreeMonths, onceInSixMonths, annually};
  return all;
}

Basalt::JSON SchedulePeriodOption::exportJSONObject() const {
  return Platform::PropertyDictionary{{std::string(kindKey), namesOf(*this).kind}};
}

Basalt::JSON SchedulePeriodOption::exportJSON() const {
  return exportJSONObject();
}

std::string SchedulePeriodOption::description() const {
  return VarnelModule::instance()->localizedString(namesOf(*this).textKey, std::nullopt,
                                                   "Schedule Period Option");
}

std::string SchedulePeriodOption::accessibilityIdentifier() const {
  return std::string(namesOf(*this).kind);
}

std::string SchedulePeriodOption::analyticsIdentifier() const {
  return std::string(namesOf(*this).analyticsIdentifier);
}

Platform::DateComponents SchedulePeriodOption::repeatInterval() const {
  const Platform::Ports& ports = Platform::processPorts();
  return repeatInterval(Platform::Calendar(ports.userLocale, ports.timeZones));
}

Platform::DateComponents SchedulePeriodOption::repeatInterval(
    const Platform::Calendar& calendar) const {
  switch (option_) {
    case Case::never:
      return {.year = yearsOfNever};
    case Case::weekly:
      return {.day = daysOfWeek(calendar)};
    case Case::onceInTwoWeeks:
      return {.day = 2 * daysOfWeek(calendar)};
    case Case::monthly:
      return {.month = 1};
    case Case::onceInThreeMonths:
      return {.month = 3};
    case Case::onceInSixMonths:
      return {.month = 6};
    case Case::annually:
      return {.year = 1};
  }
  Basalt::assertUnreachable(__FILE__, __LINE__);
}

}  // namespace Varnel
