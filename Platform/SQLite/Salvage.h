// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>

#include <Varnel/Platform/SQLite/DurableFormat.h>

namespace Varnel::Platform {

/// Copies the rows that can still be read from one database into another, where none with the same
/// key exists. What is damaged is passed over; an error is one of writing, or says that a row may
/// be read later.
[[nodiscard]] std::optional<PlatformError> salvage(SQLiteDatabase& from, SQLiteDatabase& to,
                                                   std::span<const SavedTable> tables);

}  // namespace Varnel::Platform
