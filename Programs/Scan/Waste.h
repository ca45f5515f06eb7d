// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Scan/Footprint.h>
#include <Scan/ScanResult.h>

namespace Orvane {

/// Fills in what the result's groups waste, and the totals of that. Both lists are sorted by file.
///
/// What a hole leaves out is not waste. Files that lie at the same place count as one. What a file
/// shares with files outside its group, and a file that has a name that the scan did not find, free
/// nothing. Of the files of reference none goes; of a group without one, the one that would free
/// least stays.
void computeWaste(ScanResult& result, const std::vector<Footprint>& footprints,
                  const std::vector<FileSharing>& sharings);

}  // namespace Orvane
