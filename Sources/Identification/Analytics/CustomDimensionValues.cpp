// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Analytics/CustomDimensionValues.h>

#include <cmath>

#include <fmt/format.h>

namespace Varnel {
namespace {

// The shortest text that reads back as the number; a whole number keeps its ".0".
std::string shortestText(double number) {
  if (std::isnan(number)) return "nan";
  std::string text = fmt::format("{}", number);
  if (std::isfinite(number) && text.find_first_of(".e") == std::string::npos) text += ".0";
  return text;
}

}  // namespace

Tallyhouse::CustomDimensions CustomDimensionValues::customDimensions() const {
  return {clientIdentifier,
          std::nullopt,
          shortestText(std::ceil(achievementsFractionCompleted * 100)),
          std::to_string(scanCount),
          std::to_string(cleanCount),
          std::to_string(launchCount),
          otherAppsAvailabilityString,
          downloadSourceURL.value_or("null")};
}

}  // namespace Varnel
