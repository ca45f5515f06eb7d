// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <vector>

#include <Scan/FileSystem.h>

namespace Orvane {

/// What a file takes up.
struct FileSpace {
  std::uint64_t bytes = 0;                ///< Its size at most: a hole takes up nothing.
  std::optional<SharedExtents> shared{};  ///< What it shares with others, where it does.
  bool isHeld = false;                    ///< It stays, or a name of it elsewhere does.
};

/// What is freed when files of one content go. Those that lie at the same place of a volume go
/// together or free nothing; what a single one shares with files elsewhere is not freed.
///
///     FreedSpace space;
///     for (const FileSpace& each : group) space.add(each);
///     show(space.sum());
class FreedSpace final {
 public:
  void add(const FileSpace& file);

  [[nodiscard]] std::uint64_t sum() const;
  /// The part of it that is freed least, of files that go together; 0 without files.
  [[nodiscard]] std::uint64_t least() const;

 private:
  /// Files that go together: one, or those at the same place.
  struct Unit {
    std::uint64_t bytes = 0;
    std::uint64_t sharedBytes = 0;
    std::size_t files = 0;
    bool isHeld = false;

    [[nodiscard]] std::uint64_t freedBytes() const;
  };

  std::vector<Unit> units_;
  std::map<std::uint64_t, std::size_t> unitAt_;  ///< By their places.
};

}  // namespace Orvane
