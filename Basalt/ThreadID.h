// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

#include <Varnel/Platform/Api.h>

namespace Basalt {

/// Tells threads apart for the life of the process: unlike the system's identifiers, that of an
/// ended thread never comes back.
enum class ThreadID : std::uint64_t { none = 0 };

/// The calling thread's identifier, never `none`.
[[nodiscard]] VARNEL_API ThreadID currentThreadID() noexcept;

}  // namespace Basalt
