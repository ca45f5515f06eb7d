// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <system_error>

#include <orvane/TextParts.h>

namespace Orvane {

class DuplicateList;

/// Writes a text part by part; false when a part could not be written.
using TextSource = std::function<bool(const TextWriter&)>;

/// Puts a file with the text into its place, where nothing changes before all is written, and
/// leaves everything beside it alone. One that it replaces gives it its permissions. Any thread.
[[nodiscard]] std::error_code writeFile(const std::string& path, const TextSource& source);

/// A path as other programs take it: whole, and as a file URL where it is no line of text, for its
/// bytes or a line break.
[[nodiscard]] std::string plainPath(const std::string& path);

/// The plain paths of the chosen files, a line each.
[[nodiscard]] bool writeChosenFiles(const DuplicateList& list, const TextWriter& write);

}  // namespace Orvane
