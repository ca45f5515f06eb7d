// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

/// What an error of a database file means to its user.
enum class SQLiteFailure {
  busy,      ///< Somebody else has it locked; later it may work.
  damaged,   ///< The file cannot be understood.
  full,      ///< The disk, or the user's share of it.
  readOnly,  ///< The file or its folder cannot be written.
  newer,     ///< The file's format is of a later major version.
  older,     ///< The file's format is of an earlier major version and may not be migrated.
  refused,   ///< The file is not the user's own, or not of this application.
  other
};

/// The meaning of an error of `SQLiteDatabase`, `DurableFile`, `PrivateFiles` or the system.
[[nodiscard]] SQLiteFailure meaningOf(const PlatformError& error);

/// An error of a file, with this meaning.
[[nodiscard]] PlatformError fileError(SQLiteFailure meaning, const std::string& description);

}  // namespace Varnel::Platform
