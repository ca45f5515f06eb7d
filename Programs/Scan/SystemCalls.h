// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

namespace Orvane {

// What the systems of the POSIX family do each in its own way, or not at all. CMake chooses the
// file.

/// Opens a folder that is on the way to another one, if need be without the right to list it.
extern const int openToPassThrough;

/// Opens a path below the folder and follows no symbolic link in any part of it. -1, with ENOSYS,
/// where the system can say that of the last name alone.
[[nodiscard]] int openWithoutLinksAtOnce(int folder, const char* path, int flags);

/// Opens what another program writes under a lease, once that has given the lease back. Otherwise
/// -1, with EAGAIN.
[[nodiscard]] int openLeased(int folder, const char* name);

/// Where on its disk the file begins, if the system tells.
[[nodiscard]] std::optional<std::uint64_t> placeOf(int descriptor);

}  // namespace Orvane
