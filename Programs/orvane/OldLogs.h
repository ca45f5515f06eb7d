// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>

#include <Varnel/Platform/Values/Date.h>

namespace Orvane {

/// For how long a log is kept after its last entry.
inline constexpr std::chrono::days maxLogAge{30};

/// Removes the product's logs that are older than that, and says nothing of those that it cannot.
/// The framework writes logs and removes none.
void removeOldLogs(Varnel::Platform::Date now);

}  // namespace Orvane
