// SPDX-License-Identifier: MIT
// JSON, and what periods and features make of it. What is written again is read as the same.
#include <optional>

#include <Fuzz/Fuzz.h>
#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/UserFeatures.h>
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>

using namespace Varnel;

// Absent when the value is refused.
template <typename Type>
static std::optional<Type> imported(const Basalt::JSON& json) {
  try {
    return Type(json);
  } catch (const Basalt::JSONError&) {
    return std::nullopt;
  }
}

static std::optional<Basalt::JSON> parsed(std::string_view text) {
  try {
    return Basalt::parseJSON(text);
  } catch (const Basalt::JSONError&) {
    return std::nullopt;
  }
}

static void fuzz(std::string_view input) {
  const auto json = parsed(input);
  if (!json) return;
  const std::string text = Basalt::jsonText(*json);
  const auto again = parsed(text);
  require(again && Basalt::jsonText(*again) == text);

  const auto period = imported<SchedulePeriodOption>(*json);
  if (period) require(SchedulePeriodOption(period->exportJSON()) == *period);
  require(SchedulePeriodOptionBox(*json).boxed() == period.value_or(SchedulePeriodOption::never));
  if (const auto features = imported<UserFeatures>(*json))
    require(UserFeatures(features->exportJSON()) == *features);
}
