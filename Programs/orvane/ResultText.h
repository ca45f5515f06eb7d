// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace Varnel {
class QNURLResolver;
}

namespace Varnel::Platform {
class ByteCountFormatter;
}

namespace Orvane {

struct ScanResult;

/// The result for people: each group's files, one path a line, abbreviated and as `visibleText`
/// shows it, and a summary.
[[nodiscard]] std::string textOf(const ScanResult& result,
                                 const Varnel::Platform::ByteCountFormatter& byteCounts,
                                 const Varnel::QNURLResolver& paths);

/// The result for programs: one JSON object on one line. Each of its "groups" has the "size" of a
/// file in bytes and the "paths"; the totals stand beside them. Where a path is not UTF-8, which
/// JSON texts must be, its wrong bytes show as U+FFFD, and the group also has "urls": the file URLs
/// of all its paths, in which no byte is lost.
[[nodiscard]] std::string jsonOf(const ScanResult& result);

}  // namespace Orvane
