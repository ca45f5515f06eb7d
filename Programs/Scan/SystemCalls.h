// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

#include <Scan/FileSystem.h>

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

/// Whether the files in the folder are known to be in memory alone, so that no cache holds anything
/// of them.
[[nodiscard]] bool isInMemory(int folder);

/// Whether files in the folder have the same numbers whenever they are looked at. Some file systems
/// give them out anew, as files come into use.
[[nodiscard]] bool keepsNumbers(int folder);

/// Whether the file system of the folder lets files share extents, and tells which do.
[[nodiscard]] bool tellsSharedExtents(int folder);

/// What the file shares with others, if the system tells.
[[nodiscard]] std::optional<SharedExtents> sharedExtentsOf(int descriptor);

/// Lets a part of `file` lie where that of `source` does, as `OpenFile::share` says.
[[nodiscard]] FileResult<std::optional<std::uint64_t>> shareRange(int source, int file,
                                                                  std::uint64_t offset,
                                                                  std::uint64_t length);

/// Where on its disk the file begins, if the system tells.
[[nodiscard]] std::optional<std::uint64_t> placeOf(int descriptor);

}  // namespace Orvane
