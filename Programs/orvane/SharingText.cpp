// SPDX-License-Identifier: MIT
#include <orvane/SharingText.h>

#include <nlohmann/json.hpp>
#include <string_view>

#include <Removal/Sharing.h>
#include <orvane/JSONLine.h>
#include <orvane/JSONList.h>
#include <orvane/ShownText.h>
#include <orvane/StepText.h>
#include <orvane/TextColumns.h>

namespace Orvane {
namespace {

using Outcome = SharingStep::Outcome;

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
  for (const auto group : groupsOf(sharing.steps(), &SharingStep::group)) {
    for (const SharingStep& step : group)
      if (!parts.add(lineOf(step, shownPath(sharing.pathOf(step)), form.columns))) return false;
    if (!parts.add("\n")) return false;
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
  return text + explanationsOf(sharing.steps(), wordingOf, "file stays as it is",
                               "files stay as they are");
}

bool writeJSON(const Sharing& sharing, const TextWriter& write) {
  const SharingTotals totals = sharing.totals();
  using Json = nlohmann::ordered_json;
  const Json head = {{"schemaVersion", schemaVersion}, {"planned", totals.planned},
                     {"shared", totals.shared},        {"sharedBefore", totals.alreadyShared},
                     {"notShared", totals.notShared},  {"freedBytes", totals.freedBytes}};
  TextParts parts(write);
  const auto groups = groupsOf(sharing.steps(), &SharingStep::group);
  const auto add = [&](std::size_t index, const char* comma) {
    Json json = {{"size", sharing.sizeOf(groups[index].front())}};
    for (const SharingStep& step : groups[index]) json["files"].push_back(jsonOf(sharing, step));
    return parts.add(comma + jsonText(json));
  };
  return parts.add(openJSONText(head)) && addJSONList(parts, "groups", groups.size(), add) &&
         parts.add("}\n") && parts.flush();
}

}  // namespace Orvane
