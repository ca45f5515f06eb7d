// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstdint>
#include <vector>

#include <Scan/FileTree.h>

namespace Orvane {

/// What a file takes up, where that is not just its size under one name.
struct Footprint {
  FileNumber file;
  std::uint32_t links;  ///< Its names, wherever they are.
  std::uint64_t bytes;  ///< What it takes up, its size at most: a hole takes up nothing.
};

/// What a file shares with others.
struct FileSharing {
  FileNumber file;
  SharedExtents extents;
};

/// Of a list that is sorted by file, what it has of this one, or null.
template <typename Fact>
const Fact* findFact(const std::vector<Fact>& facts, FileNumber file) {
  const auto found =
      std::lower_bound(facts.begin(), facts.end(), file,
                       [](const Fact& fact, FileNumber number) { return fact.file < number; });
  return found == facts.end() || found->file != file ? nullptr : &*found;
}

template <typename Fact>
void sortByFile(std::vector<Fact>& facts) {
  std::sort(facts.begin(), facts.end(),
            [](const Fact& a, const Fact& b) { return a.file < b.file; });
}

}  // namespace Orvane
