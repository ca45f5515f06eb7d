// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Scan/Footprint.h>

namespace Orvane {

class DiskTurns;
class FileSystem;
struct ScanControl;

/// Asks the file systems whose files may share extents which of these files do, in turns, and
/// returns those, sorted. A file that cannot be opened any more is taken for one that shares
/// nothing. Ends early when the scan is cancelled.
[[nodiscard]] std::vector<FileSharing> findSharedSpace(const FileTree& tree,
                                                       std::vector<FileNumber> files,
                                                       FileSystem& fileSystem, DiskTurns& turns,
                                                       const ScanControl& control);

}  // namespace Orvane
