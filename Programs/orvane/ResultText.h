// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <limits>
#include <string>

#include <orvane/TextParts.h>

namespace Varnel {
class QNURLResolver;
}

namespace Varnel::Platform {
class ByteCountFormatter;
}

namespace Orvane {

struct ScanResult;

/// How a result looks.
struct TextForm {
  static constexpr std::size_t allGroups = std::numeric_limits<std::size_t>::max();

  std::size_t maxGroups = allGroups;  ///< Those that waste most.
  std::size_t columns = 0;    ///< Where lines but those of paths end; 0 for lines of any length.
  bool endsWithMost = false;  ///< The group that wastes most is the last one: nearest to the user.
  bool isBold = false;        ///< Whether what is no path stands out, as terminals can show it.
  /// Asked between groups: whether to leave out the rest of them.
  std::function<bool()> shouldStop = [] { return false; };
};

/// The result for people: each group's paths, one a line, abbreviated and as `visibleText` shows
/// them, and a summary. Folders that hold the same stand for their files. Below a file's path stand
/// its further names, and a star marks one that is to stay.
///
/// Returns whether all could be written, and ends at the first part that could not.
[[nodiscard]] bool writeText(const ScanResult& result, const TextForm& form,
                             const Varnel::Platform::ByteCountFormatter& byteCounts,
                             const Varnel::QNURLResolver& paths, const TextWriter& write);

}  // namespace Orvane
