// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace Orvane {

struct Report;

/// Which file of a group stays.
enum class KeepRule {
  oldest,      ///< The one modified first.
  newest,      ///< The one modified last.
  shortest,    ///< The one with the shortest path, in bytes.
  firstFolder  ///< One in the folder that was named first to the scan.
};

/// What is chosen of one group: files by their places in the report.
struct Choice {
  std::size_t group = 0;
  std::size_t kept = 0;
  std::vector<std::size_t> victims{};  ///< None of them twice.
  bool isTie = false;  ///< The rule has several answers; the first in the group's order was taken.

  bool operator==(const Choice&) const = default;
};

/// What is to be removed, and what stays for it. A plain value, made by a rule or by hand.
using Selection = std::vector<Choice>;

/// Whether a file may be gone at any moment, by its path.
using IsPassing = std::function<bool(const std::string& path)>;

/// Keeps one file of each group by the rule, and of each that has references one of those; one that
/// is passing only where all are. All others are victims, but for references. Groups with nothing
/// to remove have no choice.
[[nodiscard]] Selection select(
    const Report& report, KeepRule rule,
    const IsPassing& isPassing = [](const std::string&) { return false; });

/// Why a selection must not be acted on, and where.
struct Refusal {
  enum class Reason {
    unknown,    ///< No such group or file, or one named twice.
    kept,       ///< A victim is a file that stays, of any group and by any of its names.
    reference,  ///< Likewise a reference.
  };

  Reason reason = Reason::unknown;
  std::size_t choice = 0;  ///< Its place in the selection.
};

/// Whether a file of every group stays, and every reference. Selections of any origin pass it
/// before anything is removed.
[[nodiscard]] std::optional<Refusal> check(const Report& report, const Selection& selection);

}  // namespace Orvane
