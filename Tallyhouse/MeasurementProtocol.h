// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <string>
#include <string_view>

#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Tallyhouse {

/// Says whose events they are.
struct AnalyticsIdentity final {
  std::string trackingID;  ///< The property that counts them.
  std::string clientID;    ///< The installation that sends them.
};

/// The event as one line of the measurement protocol, version 1: "v=1&t=event&tid=…&ec=…&cd1=…".
/// The facts that are known only on sending are still missing.
[[nodiscard]] std::string encodedHit(const AnalyticsEvent& event,
                                     const AnalyticsIdentity& identity);

/// Appends a line to a batch: the hit, its age, and the event's UUID in the parameter that the
/// protocol reserves for telling hits apart.
void appendToBatch(std::string& batch, std::string_view hit, std::chrono::milliseconds age,
                   std::string_view uuid);

/// The largest hit that servers accept, less the room for what `appendToBatch` adds.
inline constexpr std::size_t maxHitBytes = 8192 - 96;

}  // namespace Tallyhouse
