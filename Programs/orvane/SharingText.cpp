// SPDX-License-Identifier: MIT
#include <orvane/SharingText.h>

#include <algorithm>
#include <map>
#include <nlohmann/json.hpp>
#include <string_view>

#include <Removal/Sharing.h>
#include <orvane/JSONLine.h>
#include <orvane/ShownText.h>
#include <orvane/TextColumns.h>

namespace Orvane {
namespace {

using Outcome = SharingStep::Outcome;

struct Wording {
  const char* word;         ///< Behind a path, and in JSON.
  const char* explanation;  ///< Behind a count of files that stay as they are.
};

Wording wordingOf(Outcome outcome) {
  switch (outcome) {
    case Outcome::source:
      return {"source", ""};
    case Outcome::planned:
      return {"planned", ""};
    case Outcome::shared:
      return {"shared", ""};
    case Outcome::alreadyShared:
      return {"shared before", "shared before"};
    case Outcome::withoutExtents:
      return {"no extents", "so small, or so empty, that there is nothing to share"};
    case Outcome::onOtherFileSystem:
      return {"other volume", "on another volume than those that it equals"};
    case Outcome::unsupported:
      return {"unsupported", "on a file system that cannot share extents"};
    case Outcome::readOnly:
      return {"read-only", "on a volume that is mounted read-only"};
    case Outcome::notPermitted:
      return {"not permitted", "that the user may not change"};
    case Outcome::changed:
      return {"changed", "changed since the report"};
    case Outcome::different:
      return {"different", "of another content than those of its group"};
    case Outcome::unreadable:
      return {"unreadable", "that cannot be read"};
    case Outcome::noAccess:
      return {"no access", "on a disk that gives no access"};
    case Outcome::failed:
      return {"failed", "that the system would not share"};
    case Outcome::stopped:
      break;
  }
  return {"stopped", "not reached, or not to the end"};
}

std::string lineOf(const SharingStep& step, const std::string& path, std::size_t columns) {
  const Wording wording = wordingOf(step.outcome);
  std::string line = "left    ", mark;
  if (*wording.explanation == '\0') {
    line = padded(wording.word, line.size());
  } else {
    mark = std::string(" [") + wording.word;
    if (step.code && step.outcome == Outcome::failed) mark += ": " + step.code.message();
    mark += "]";
  }
  const std::size_t taken = line.size() + mark.size();
  line += columns > taken ? fitted(path, columns - taken) : path;
  return line + mark + "\n";
}

bool isLastOfGroup(const Sharing& sharing, const SharingStep& step) {
  return &step == &sharing.steps().back() || (&step)[1].group != step.group;
}

nlohmann::ordered_json jsonOf(const Sharing& sharing, const SharingStep& step) {
  nlohmann::ordered_json json;
  addPath(json, "path", "url", sharing.pathOf(step));
  json["outcome"] = wordingOf(step.outcome).word;
  if (step.code) json["reason"] = step.code.message();
  json["freedBytes"] = step.freedBytes;
  return json;
}

}  // namespace

bool writeText(const Sharing& sharing, SharingForm form, const TextWriter& write) {
  TextParts parts(write);
  for (const SharingStep& step : sharing.steps()) {
    if (!parts.add(lineOf(step, shownPath(sharing.pathOf(step)), form.columns))) return false;
    if (isLastOfGroup(sharing, step) && !parts.add("\n")) return false;
  }
  return parts.flush();
}

std::string summaryOf(const Sharing& sharing, SharingForm form) {
  const SharingTotals totals = sharing.totals();
  const std::string size = shownSize(totals.freedBytes);
  std::string text = form.isTrial ? counted(totals.planned, "file", "files") + " would be shared"
                                  : counted(totals.shared, "file is", "files are") + " shared now";
  if (totals.freedBytes > 0) text += ": " + size + (form.isTrial ? " would be free" : " are free");
  text += "\n";
  std::map<Outcome, std::uint64_t> counts;
  for (const SharingStep& step : sharing.steps()) ++counts[step.outcome];
  for (const auto& [outcome, number] : counts)
    if (const std::string_view why = wordingOf(outcome).explanation; !why.empty())
      text += counted(number, "file stays as it is", "files stay as they are") + ": " +
              std::string(why) + "\n";
  return text;
}

bool writeJSON(const Sharing& sharing, const TextWriter& write) {
  const SharingTotals totals = sharing.totals();
  using Json = nlohmann::ordered_json;
  std::string head = jsonLine({{"schemaVersion", schemaVersion},
                               {"planned", totals.planned},
                               {"shared", totals.shared},
                               {"sharedBefore", totals.alreadyShared},
                               {"notShared", totals.notShared},
                               {"freedBytes", totals.freedBytes},
                               {"groups", Json::array()}});
  const std::string_view tail = "]}\n";
  head.resize(head.size() - tail.size());
  TextParts parts(write);
  if (!parts.add(head)) return false;
  Json group;
  std::string_view separator;
  for (const SharingStep& step : sharing.steps()) {
    if (group.empty()) group["size"] = sharing.sizeOf(step);
    group["files"].push_back(jsonOf(sharing, step));
    if (!isLastOfGroup(sharing, step)) continue;
    std::string text = jsonLine(group);
    text.pop_back();  // The end of the line.
    if (!parts.add(std::string(separator) + text)) return false;
    separator = ",";
    group.clear();
  }
  return parts.add(tail) && parts.flush();
}

}  // namespace Orvane
