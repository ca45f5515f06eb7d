// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>

#include <orvane/TextParts.h>

namespace Orvane {

class Sharing;

/// How a sharing is written.
struct SharingForm {
  std::size_t columns = 0;  ///< Of the terminal; 0 where there is no terminal.
  bool isTrial = false;
};

/// The sharing for people: each file on a line, and an empty line behind each group. Returns
/// whether all could be written.
[[nodiscard]] bool writeText(const Sharing& sharing, SharingForm form, const TextWriter& write);

/// What is said behind it: how many files, what that freed, and why others stay as they are.
[[nodiscard]] std::string summaryOf(const Sharing& sharing, SharingForm form);

/// The sharing for programs: one JSON object on one line.
[[nodiscard]] bool writeJSON(const Sharing& sharing, const TextWriter& write);

}  // namespace Orvane
