// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include <Scan/DiskTurns.h>

namespace Orvane {

/// Whether the absolute path is that of the folder, or of something below it.
[[nodiscard]] bool liesIn(std::string_view path, std::string_view folder);

/// Where file systems were mounted when it was made. Immutable; any thread.
class Mounts final {
 public:
  explicit Mounts(std::vector<ScanMount> mounts);

  /// What is mounted on this folder; null if nothing is.
  [[nodiscard]] const ScanMount* at(std::string_view folder) const;
  /// What holds the path; null if that is not known.
  [[nodiscard]] const ScanMount* around(std::string_view path) const;
  /// Whether something is mounted below the folder.
  [[nodiscard]] bool hasBelow(std::string_view folder) const;
  /// What is mounted below it with nothing between.
  [[nodiscard]] std::vector<const ScanMount*> nextBelow(std::string_view folder) const;

 private:
  using Iterator = std::vector<ScanMount>::const_iterator;
  /// The first that is mounted below the folder, if one is: what is below comes right after.
  [[nodiscard]] Iterator firstBelow(std::string_view folder) const;

  std::vector<ScanMount> mounts_;  ///< In the order of their paths with a "/" at the end.
};

}  // namespace Orvane
