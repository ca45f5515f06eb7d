// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/Date.h>

namespace Tallyhouse {

/// Values of custom dimensions by position: the first is dimension 1. An absent one is not sent.
using CustomDimensions = std::vector<std::optional<std::string>>;
/// Values of custom metrics by position: the first is metric 1. An absent one is not sent.
using CustomMetrics = std::vector<std::optional<std::int64_t>>;

/// Something that happened in the application. A plain value.
struct AnalyticsEvent final {
  std::string uuid;  ///< Tells a repeated delivery from a second event.
  Varnel::Platform::Date date;
  std::string category;
  std::string action;
  std::optional<std::string> label;
  std::optional<std::int64_t> value;
  CustomDimensions customDimensions;
  CustomMetrics customMetrics;
  bool isTest = false;  ///< Sent, but marked as a test.
};

}  // namespace Tallyhouse
