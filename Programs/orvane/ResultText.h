// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace Varnel {
class QNURLResolver;
}

namespace Varnel::Platform {
class ByteCountFormatter;
}

namespace Orvane {

struct ScanResult;

/// "1 file", "2 files".
[[nodiscard]] std::string counted(std::uint64_t count, const char* singular, const char* plural);

/// Takes the next part of a text, of some 64 kB; false when it could not be written.
using TextWriter = std::function<bool(std::string_view)>;

// A result may name millions of files, so its text is never whole in memory. Both functions return
// whether all of it could be written, and end at the first part that could not.

/// The result for people: each group's files, one path a line, abbreviated and as `visibleText`
/// shows it, and a summary.
[[nodiscard]] bool writeText(const ScanResult& result,
                             const Varnel::Platform::ByteCountFormatter& byteCounts,
                             const Varnel::QNURLResolver& paths, const TextWriter& write);

/// The result for programs: one JSON object on one line. Each of its "groups" has the "size" of a
/// file in bytes and the "paths"; the totals stand beside them. Where a path is not UTF-8, which
/// JSON texts must be, its wrong bytes show as U+FFFD, and the group also has "urls": the file URLs
/// of all its paths, in which no byte is lost.
[[nodiscard]] bool writeJSON(const ScanResult& result, const TextWriter& write);

}  // namespace Orvane
