// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Values/PlatformError.h>

struct sqlite3;

namespace Varnel::Platform {

/// The connection's last failure as an error; `status` is its result code. The connection may be
/// null: then the library was out of memory.
[[nodiscard]] PlatformError sqliteError(sqlite3* connection, int status);

}  // namespace Varnel::Platform
