// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Varnel {

/// The line by which the log shows an event.
[[nodiscard]] std::string analyticsEcho(std::string_view category, std::string_view action,
                                        const std::optional<std::string>& label,
                                        std::optional<std::int64_t> value,
                                        const Tallyhouse::CustomDimensions& customDimensions);

}  // namespace Varnel
