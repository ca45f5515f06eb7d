// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Orvane {

/// A pattern for names or paths, as shells know it: `*` stands for any characters, `?` for one,
/// `[a-z]` for one of some, and `\` takes the meaning of the next away. None of them stands for a
/// "/", and a dot in front of a name is a character like any other.
///
///     Glob("*.jpg")           // names: without a "/" in it
///     Glob("/srv/*/old")      // whole paths
///     Glob("build/**/*.o")    // paths from any folder on: ** are folders in any number
///     Glob("cache/")          // the same as cache/**: all that is in it
///
/// Names are text in UTF-8, whatever the locale of the process; those that are not are bytes. Any
/// thread.
class Glob final {
 public:
  enum class Kind { file, folder };

  explicit Glob(std::string_view pattern);

  /// Whether it is for paths rather than names.
  [[nodiscard]] bool isForPaths() const { return isForPaths_; }
  [[nodiscard]] bool matchesName(const std::string& name) const;
  /// An absolute path. A pattern for all that is in a folder is also one for that folder.
  [[nodiscard]] bool matchesPath(std::string path, Kind kind) const;

 private:
  bool isForPaths_;
  std::vector<std::string> steps_;  ///< One for each name of a path, or the one for names.
};

}  // namespace Orvane
