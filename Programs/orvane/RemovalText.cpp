// SPDX-License-Identifier: MIT
#include <orvane/RemovalText.h>

#include <algorithm>
#include <nlohmann/json.hpp>
#include <string_view>
#include <utility>
#include <vector>

#include <Removal/Removal.h>
#include <orvane/JSONLine.h>
#include <orvane/JSONList.h>
#include <orvane/ShownText.h>
#include <orvane/StepText.h>
#include <orvane/TextColumns.h>

namespace Orvane {
namespace {

using Outcome = RemovalStep::Outcome;

Wording wordingOf(Outcome outcome) {
  switch (outcome) {
    case Outcome::planned:
      return {"planned", ""};
    case Outcome::moved:
      return {"moved", ""};
    case Outcome::inHiddenFolder:
      return {"hidden folder", "in a hidden folder (--allow-hidden)"};
    case Outcome::onOtherFileSystem:
      return {"other volume", "on another volume than the file that stays (--allow-volumes)"};
    case Outcome::packaged:
      return {"packaged", "owned by the package system (--allow-packaged)"};
    case Outcome::hardLinked:
      return {"hard link", "with other hard links, so that nothing is freed (--allow-hard-links)"};
    case Outcome::inTrash:
      return {"in trash", "in the trash already, or of which the one to stay is"};
    case Outcome::changed:
      return {"changed", "of a group that has changed since the report"};
    case Outcome::different:
      return {"different", "that differ from the one that stays, or are that very file"};
    case Outcome::unreadable:
      return {"unreadable", "that cannot be read, or whose group cannot"};
    case Outcome::noAccess:
      return {"no access", "on a disk that gives no access"};
    case Outcome::noTrash:
      return {"no trash", "on a file system without a trash"};
    case Outcome::notJournalled:
      return {"no journal", "that could not be noted in the journal"};
    case Outcome::failed:
      return {"failed", "that the system would not move"};
    case Outcome::misplaced:
      return {"misplaced", "in whose place something else went to the trash: restore it"};
    case Outcome::stopped:
      break;
  }
  return {"stopped", "that were not reached"};
}

bool goes(const RemovalStep& step) {
  return step.outcome == Outcome::planned || step.outcome == Outcome::moved;
}

/// Lines in two columns of a terminal, or each path on a line of its own.
class Lines final {
 public:
  explicit Lines(RemovalForm form) : form_(form) {
    constexpr std::size_t minSideBySide = 60;
    if (form.columns < minSideBySide) return;
    left_ = (form.columns - gap_) / 2;
    right_ = form.columns - gap_ - left_;
  }

  [[nodiscard]] std::string head() const {
    return left_ > 0 ? row("Stays", form_.isMade ? "Moved to the trash" : "Goes to the trash") : "";
  }

  /// Before what follows. In one column, each group ends with it.
  [[nodiscard]] std::string tail() const { return left_ > 0 ? "\n" : ""; }

  [[nodiscard]] std::string group(const std::string& kept, bool isTie,
                                  const std::vector<std::pair<std::string, std::string>>& victims) {
    const std::string mark = isTie ? " [tie]" : "";
    std::string text;
    if (left_ == 0) {
      text = line("stays ", kept, mark);
      for (const auto& [path, why] : victims)
        text += line(!why.empty() ? "left  " : form_.isMade ? "moved " : "trash ", path, why);
      return text + "\n";
    }
    for (bool isFirst = true; const auto& [path, why] : victims) {
      text += row(isFirst ? cut(kept, mark, left_) : "", cut(path, why, right_));
      isFirst = false;
    }
    return text;
  }

 private:
  static constexpr std::size_t gap_ = 2;

  [[nodiscard]] static std::string cut(const std::string& path, const std::string& mark,
                                       std::size_t columns) {
    return fitted(path, columns - std::min(columns, mark.size())) + mark;
  }
  [[nodiscard]] std::string row(const std::string& left, const std::string& right) const {
    return padded(left, left_ + gap_) + right + "\n";
  }
  [[nodiscard]] std::string line(std::string_view word, const std::string& path,
                                 const std::string& mark) const {
    std::string text(word);
    const bool isCut = form_.columns > text.size();
    text += isCut ? cut(path, mark, form_.columns - text.size()) : path + mark;
    return text + "\n";
  }

  const RemovalForm form_;
  std::size_t left_ = 0;  ///< 0 where all is in one column.
  std::size_t right_ = 0;
};

nlohmann::ordered_json jsonOf(const Removal& removal, const RemovalStep& step) {
  nlohmann::ordered_json json;
  addPath(json, "path", "url", removal.pathOf(step));
  json["outcome"] = wordingOf(step.outcome).word;
  if (step.code) json["reason"] = step.code.message();
  if (step.otherNames > 0) json["otherNames"] = step.otherNames;
  return json;
}

}  // namespace

bool writeText(const Removal& removal, const Selection& selection, RemovalForm form,
               const TextWriter& write) {
  Lines lines(form);
  TextParts parts(write);
  if (!removal.steps().empty() && !parts.add(lines.head())) return false;
  for (const auto group : groupsOf(removal.steps(), &RemovalStep::choice)) {
    std::vector<std::pair<std::string, std::string>> victims;
    for (const RemovalStep& step : group)
      victims.emplace_back(
          shownPath(removal.pathOf(step)),
          goes(step) ? "" : std::string(" [") + wordingOf(step.outcome).word + "]");
    const RemovalStep& any = group.front();
    if (!parts.add(
            lines.group(shownPath(removal.keptFor(any)), selection[any.choice].isTie, victims)))
      return false;
  }
  return (removal.steps().empty() || parts.add(lines.tail())) && parts.flush();
}

std::string summaryOf(const Removal& removal, RemovalForm form) {
  const auto linked = static_cast<std::uint64_t>(
      std::count_if(removal.steps().begin(), removal.steps().end(),
                    [](const RemovalStep& step) { return goes(step) && step.otherNames > 0; }));
  const RemovalTotals totals = removal.totals();
  const std::string size = shownSize(form.isMade ? totals.freedBytes : totals.plannedBytes);
  const std::uint64_t count = form.isMade ? totals.moved : totals.planned;
  std::string text;
  if (form.isMade) {
    text = counted(count, "file was", "files were") + " moved to the trash";
    if (count > 0) text += ": " + size + " are free once it is emptied";
  } else {
    text = counted(count, "file", "files") + " would go to the trash";
    if (count > 0) text += ": " + size + " would be free once it is emptied";
  }
  text += "\n";
  if (linked > 0)
    text += counted(linked, "of them frees", "of them free") +
            " nothing, as other hard links of it stay\n";
  return text + explanationsOf(removal.steps(), wordingOf, "file stays", "files stay");
}

bool writeJSON(const Removal& removal, const Selection& selection, const TextWriter& write) {
  const RemovalTotals totals = removal.totals();
  using Json = nlohmann::ordered_json;
  const Json head = {{"schemaVersion", schemaVersion},
                     {"removal", removal.number() > 0 ? Json(removal.number()) : Json()},
                     {"moved", totals.moved},
                     {"notAllowed", totals.notAllowed},
                     {"notMoved", totals.notMoved},
                     {"freedBytes", totals.freedBytes}};
  TextParts parts(write);
  const auto groups = groupsOf(removal.steps(), &RemovalStep::choice);
  const auto add = [&](std::size_t index, const char* comma) {
    const RemovalStep& any = groups[index].front();
    Json json = {{"size", removal.sizeOf(any)}};
    addPath(json, "kept", "keptURL", removal.keptFor(any));
    json["tie"] = selection[any.choice].isTie;
    for (const RemovalStep& step : groups[index]) json["files"].push_back(jsonOf(removal, step));
    return parts.add(comma + jsonText(json));
  };
  return parts.add(openJSONText(head)) && addJSONList(parts, "groups", groups.size(), add) &&
         parts.add("}\n") && parts.flush();
}

}  // namespace Orvane
