// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <limits>
#include <map>
#include <string>
#include <vector>

namespace Orvane {

/// What to scan, and which of the files there take part.
///
///     ScanRequest request{.folders = {"/home/u"}, .minSize = 1'000'000};
///     request.exclude = {"node_modules", "/home/u/.cache"};
///
/// Paths are absolute and without symbolic links. They may overlap: no file is scanned twice. See
/// `Glob` for the patterns.
struct ScanRequest {
  std::vector<std::string> folders{};  ///< To be scanned with all below them.
  /// The same, but their files are to stay. A file is one of theirs if any of its hard links is.
  std::vector<std::string> references{};
  /// Single files: their names, by the folder that they are in.
  std::map<std::string, std::vector<std::string>> files{};

  /// In bytes, of every file that takes part.
  std::uint64_t minSize = 0;
  std::uint64_t maxSize = std::numeric_limits<std::uint64_t>::max();

  // The rest chooses among what is found below folders. What the request names is always scanned.

  std::vector<std::string> include{};  ///< Files alone; empty: all of them.
  std::vector<std::string> exclude{};  ///< Files, and folders with all below them.
  bool skipsHidden = false;            ///< What has a name with a dot in front.
  bool staysOnFileSystem = false;      ///< Enters no other one that is mounted below.
};

}  // namespace Orvane
