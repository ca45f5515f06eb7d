// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <Varnel/Platform/SQLite/DurableFile.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Tallyhouse {

using Varnel::Platform::Date;
using Varnel::Platform::DurableFile;
using Varnel::Platform::SQLiteDatabase;
using Failure = std::optional<Varnel::Platform::PlatformError>;  ///< None when it was done.

/// An event in the spool.
struct SpooledEvent final {
  /// The time and, in the last bits, a random number of its recorder's: so it grows with time,
  /// differs between files, and tells who recorded it.
  std::int64_t id = 0;
  std::string uuid;
  Date date;
  std::string hit;
  int refusals = 0;  ///< How often the server would not have it. 0: it waits in line.
  Date epoch;        ///< In which it was recorded. Not kept in the file.
};

/// Between two events of one recorder their numbers differ by a multiple of this.
inline constexpr std::int64_t idStep = 1 << 16;

/// Between two attempts at a file that cannot be had.
inline const Varnel::Platform::GrowingPause spoolPause{std::chrono::milliseconds(10),
                                                       std::chrono::seconds(30)};

/// The file that the processes of a product share: events by their number, and one row of state.
///
/// The epoch is the time of the last refusal of consent, 0 if there was none. What was recorded in
/// an earlier epoch must not come into the file any more.
[[nodiscard]] const Varnel::Platform::DurableFormat& spoolFormat();

}  // namespace Tallyhouse
