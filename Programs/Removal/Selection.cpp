// SPDX-License-Identifier: MIT
#include <Removal/Selection.h>

#include <algorithm>
#include <set>
#include <string>
#include <string_view>
#include <tuple>
#include <unordered_map>

#include <Removal/Report.h>

namespace Orvane {
namespace {

// What a rule compares: the least one stays.
using RuleRank = std::tuple<std::int64_t, std::int64_t>;
using Rank = std::tuple<bool, RuleRank>;

RuleRank rankOf(const ReportFile& file, KeepRule rule, const Report& report) {
  switch (rule) {
    case KeepRule::oldest:
      return {file.modified, file.nanoseconds};
    case KeepRule::newest:
      // The complement, as the least number has no opposite.
      return {~file.modified, ~std::int64_t{file.nanoseconds}};
    case KeepRule::shortest:
      return {static_cast<std::int64_t>(file.path.size()), 0};
    case KeepRule::firstFolder:
      break;
  }
  const auto root =
      std::find_if(report.roots.begin(), report.roots.end(),
                   [&](const std::string& folder) { return isBelow(file.path, folder); });
  return {root - report.roots.begin(), 0};
}

Choice choose(const ReportGroup& group, KeepRule rule, const Report& report,
              const IsPassing& isPassing) {
  const bool hasReference = std::any_of(group.files.begin(), group.files.end(),
                                        [](const ReportFile& file) { return file.isReference; });
  Choice choice;
  std::optional<Rank> best;
  for (std::size_t i = 0; i < group.files.size(); ++i) {
    const ReportFile& file = group.files[i];
    if (!file.isReference) choice.victims.push_back(i);
    if (file.isReference != hasReference) continue;
    const Rank rank = {isPassing(file.path), rankOf(file, rule, report)};
    choice.isTie = best == rank || (choice.isTie && best < rank);
    if (best && *best <= rank) continue;
    best = rank;
    choice.kept = i;
  }
  std::erase(choice.victims, choice.kept);
  return choice;
}

/// All names of the files that stay, and why: whatever group names them.
class Staying final {
 public:
  void add(const ReportFile& file, Refusal::Reason reason) {
    reasons_.emplace(file.path, reason);
    for (const std::string& name : file.names) reasons_.emplace(name, reason);
  }

  [[nodiscard]] std::optional<Refusal::Reason> objectionTo(const ReportFile& victim) const {
    if (const auto found = reasons_.find(victim.path); found != reasons_.end())
      return found->second;
    for (const std::string& name : victim.names)
      if (const auto found = reasons_.find(name); found != reasons_.end()) return found->second;
    return std::nullopt;
  }

 private:
  std::unordered_map<std::string_view, Refusal::Reason> reasons_;
};

bool isKnown(const ReportGroup& group, const Choice& choice) {
  std::set<std::size_t> seen;
  return choice.kept < group.files.size() &&
         std::all_of(choice.victims.begin(), choice.victims.end(), [&](std::size_t victim) {
           return victim < group.files.size() && seen.insert(victim).second;
         });
}

}  // namespace

bool isBelow(std::string_view path, std::string_view folder) {
  while (folder.ends_with('/')) folder.remove_suffix(1);
  return path.starts_with(folder) && path.substr(folder.size()).starts_with('/');
}

Selection select(const Report& report, KeepRule rule, const IsPassing& isPassing) {
  Selection selection;
  for (std::size_t i = 0; i < report.groups.size(); ++i) {
    Choice choice = choose(report.groups[i], rule, report, isPassing);
    choice.group = i;
    if (!choice.victims.empty()) selection.push_back(std::move(choice));
  }
  return selection;
}

std::optional<Refusal> check(const Report& report, const Selection& selection) {
  using enum Refusal::Reason;
  Staying staying;
  for (const ReportGroup& group : report.groups)
    for (const ReportFile& file : group.files)
      if (file.isReference) staying.add(file, reference);
  std::set<std::size_t> seen;
  for (std::size_t i = 0; i < selection.size(); ++i) {
    const Choice& choice = selection[i];
    if (choice.group >= report.groups.size() || !seen.insert(choice.group).second ||
        !isKnown(report.groups[choice.group], choice))
      return Refusal{.reason = unknown, .choice = i};
    staying.add(report.groups[choice.group].files[choice.kept], kept);
  }
  for (std::size_t i = 0; i < selection.size(); ++i)
    for (const std::size_t victim : selection[i].victims)
      if (const auto reason = staying.objectionTo(report.groups[selection[i].group].files[victim]))
        return Refusal{.reason = *reason, .choice = i};
  return std::nullopt;
}

}  // namespace Orvane
