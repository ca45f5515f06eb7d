// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>

#include <Removal/Selection.h>
#include <orvane/TextParts.h>

namespace Orvane {

class Removal;

/// How a removal is written.
struct RemovalForm {
  std::size_t columns = 0;  ///< Of the terminal; 0 where there is no terminal.
  bool isMade = false;      ///< Or else it is only planned.
};

/// The removal for people: the file that stays of each group, beside those that go, or below one
/// another where there is no terminal, or a narrow one. Returns whether all could be written.
[[nodiscard]] bool writeText(const Removal& removal, const Selection& selection, RemovalForm form,
                             const TextWriter& write);

/// What is said behind it: how many files, what they free, and why others stay where they are.
[[nodiscard]] std::string summaryOf(const Removal& removal, RemovalForm form);

/// The removal for programs: one JSON object on one line.
[[nodiscard]] bool writeJSON(const Removal& removal, const Selection& selection,
                             const TextWriter& write);

}  // namespace Orvane
