// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include <Removal/Report.h>
#include <Removal/Selection.h>

namespace Orvane {

/// The report without the files of these paths, and without the groups of which one file is left.
[[nodiscard]] Report reportWithout(const Report& report, const std::set<std::string>& gone);

/// The groups of a scan, and which of their files the user has chosen. Of no group all files can be
/// chosen, nor a reference, by a rule or by hand.
///
///     DuplicateList list(report);
///     list.choose(select(list.report(), KeepRule::oldest));
///     if (list.choose({group, file}, true) == DuplicateList::Answer::lastOfGroup) beep();
///
/// A value; one thread at a time. Choosing one file takes the same time in any list.
class DuplicateList final {
 public:
  struct Place {
    std::size_t group = 0;
    std::size_t file = 0;

    bool operator==(const Place&) const = default;
  };
  struct Figures {
    std::uint64_t files = 0;
    std::uint64_t bytes = 0;

    bool operator==(const Figures&) const = default;
  };
  enum class Answer { done, lastOfGroup, reference };

  /// The report is not changed any more.
  explicit DuplicateList(std::shared_ptr<const Report> report);

  [[nodiscard]] const std::shared_ptr<const Report>& report() const { return report_; }
  [[nodiscard]] const ReportGroup& group(std::size_t number) const {
    return report_->groups[number];
  }
  [[nodiscard]] const ReportFile& file(Place place) const {
    return report_->groups[place.group].files[place.file];
  }

  /// All files that could go, but for one of each group.
  [[nodiscard]] const Figures& duplicates() const { return duplicates_; }
  [[nodiscard]] const Figures& chosen() const { return chosen_; }
  [[nodiscard]] bool isChosen(Place place) const { return choices_[indexOf(place)]; }

  /// Anything but `done` has changed nothing.
  Answer choose(Place place, bool isChosen);
  /// Chooses the victims of the selection, and nothing else. It comes from this report.
  void choose(const Selection& selection);

  /// What is chosen. Of the files of a group that are not, a reference stays for them, else the
  /// first that is not passing, else the first.
  [[nodiscard]] Selection selection(const IsPassing& isPassing) const;

  /// The next chosen file behind a place, from the beginning again after the last; the place itself
  /// when there is no other.
  [[nodiscard]] Place nextChosen(Place place) const;

 private:
  [[nodiscard]] std::size_t indexOf(Place place) const { return begins_[place.group] + place.file; }
  void count(Place place, bool isChosen);

  std::shared_ptr<const Report> report_;
  std::vector<std::size_t> begins_;            ///< Of each group, among all files.
  std::vector<bool> choices_;                  ///< Of each file.
  std::vector<std::uint32_t> chosenOfGroups_;  ///< How many, of each group.
  Figures duplicates_;
  Figures chosen_;
};

}  // namespace Orvane
