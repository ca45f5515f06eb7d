// SPDX-License-Identifier: MIT
#include <orvane-window/Model/DuplicateList.h>

#include <algorithm>
#include <utility>

namespace Orvane {

Report reportWithout(const Report& report, const std::set<std::string>& gone) {
  Report rest{.isPartial = report.isPartial, .roots = report.roots};
  for (const ReportGroup& group : report.groups) {
    ReportGroup left{.size = group.size};
    std::copy_if(group.files.begin(), group.files.end(), std::back_inserter(left.files),
                 [&](const ReportFile& file) { return !gone.contains(file.path); });
    if (left.files.size() > 1) rest.groups.push_back(std::move(left));
  }
  return rest;
}

DuplicateList::DuplicateList(std::shared_ptr<const Report> report)
    : report_(std::move(report)), chosenOfGroups_(report_->groups.size()) {
  std::size_t files = 0;
  begins_.reserve(report_->groups.size());
  for (const ReportGroup& group : report_->groups) {
    begins_.push_back(files);
    files += group.files.size();
    const auto references = static_cast<std::uint64_t>(
        std::count_if(group.files.begin(), group.files.end(),
                      [](const ReportFile& file) { return file.isReference; }));
    const std::uint64_t spare =
        group.files.size() - std::max<std::uint64_t>(references, group.files.empty() ? 0 : 1);
    duplicates_.files += spare;
    duplicates_.bytes += spare * group.size;
  }
  choices_.resize(files);
}

DuplicateList::Answer DuplicateList::choose(Place place, bool isChosen) {
  if (isChosen == this->isChosen(place)) return Answer::done;
  if (isChosen && file(place).isReference) return Answer::reference;
  if (isChosen && chosenOfGroups_[place.group] + 1 == group(place.group).files.size())
    return Answer::lastOfGroup;
  count(place, isChosen);
  return Answer::done;
}

void DuplicateList::choose(const Selection& selection) {
  std::fill(choices_.begin(), choices_.end(), false);
  std::fill(chosenOfGroups_.begin(), chosenOfGroups_.end(), 0);
  chosen_ = {};
  for (const Choice& choice : selection)
    for (const std::size_t victim : choice.victims) choose({choice.group, victim}, true);
}

void DuplicateList::count(Place place, bool isChosen) {
  choices_[indexOf(place)] = isChosen;
  const std::uint64_t size = group(place.group).size;
  if (isChosen) {
    ++chosenOfGroups_[place.group];
    ++chosen_.files;
    chosen_.bytes += size;
  } else {
    --chosenOfGroups_[place.group];
    --chosen_.files;
    chosen_.bytes -= size;
  }
}

Selection DuplicateList::selection(const IsPassing& isPassing) const {
  Selection selection;
  for (std::size_t number = 0; number < report_->groups.size(); ++number) {
    if (chosenOfGroups_[number] == 0) continue;
    Choice choice{.group = number};
    const auto& files = group(number).files;
    int worth = -1;  // Of the file that stays so far.
    for (std::size_t i = 0; i < files.size(); ++i) {
      if (isChosen({number, i})) {
        choice.victims.push_back(i);
        continue;
      }
      const int itsWorth = files[i].isReference ? 2 : isPassing(files[i].path) ? 0 : 1;
      if (itsWorth > worth) choice.kept = i;
      worth = std::max(worth, itsWorth);
    }
    selection.push_back(std::move(choice));
  }
  return selection;
}

DuplicateList::Place DuplicateList::nextChosen(Place place) const {
  if (choices_.empty()) return place;
  const auto start = choices_.begin() + static_cast<std::ptrdiff_t>(indexOf(place));
  auto found = std::find(start + 1, choices_.end(), true);
  if (found == choices_.end()) found = std::find(choices_.begin(), start, true);
  if (!*found) return place;
  const auto index = static_cast<std::size_t>(found - choices_.begin());
  const auto behind = std::upper_bound(begins_.begin(), begins_.end(), index);
  const auto number = static_cast<std::size_t>(behind - begins_.begin()) - 1;
  return {number, index - begins_[number]};
}

}  // namespace Orvane
