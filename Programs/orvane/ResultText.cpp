// SPDX-License-Identifier: MIT
#include <orvane/ResultText.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include <Scan/ScanResult.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/UTF8.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Platform/Values/URL.h>
#include <orvane/JSONLine.h>

namespace Orvane {
namespace {

using Varnel::Platform::ByteCountFormatter;
using Varnel::Platform::ByteCountStyle;
using Varnel::Platform::URL;
using Varnel::Platform::visibleText;

std::string counted(std::uint64_t count, const char* singular, const char* plural) {
  return std::to_string(count) + " " + (count == 1 ? singular : plural);
}

std::string summary(const ScanTotals& totals, std::size_t groups, const std::string& wasted) {
  std::string text = counted(totals.files, "file", "files") + " in " +
                     counted(totals.folders, "folder", "folders") + ": ";
  if (groups == 0) {
    text += "no duplicates";
  } else {
    text += counted(totals.duplicateFiles, "duplicate", "duplicates") + " in " +
            counted(groups, "group", "groups") + ", " + wasted + " wasted";
  }
  const auto add = [&](std::uint64_t count, const char* singular, const char* plural) {
    if (count > 0) text += "; " + counted(count, singular, plural);
  };
  add(totals.unreadableFiles, "file could not be read", "files could not be read");
  add(totals.vanishedFiles, "file vanished", "files vanished");
  add(totals.changedFiles, "file changed meanwhile", "files changed meanwhile");
  add(totals.unreadableFolders, "folder could not be read", "folders could not be read");
  return text + "\n";
}

nlohmann::ordered_json jsonOf(const DuplicateGroup& group) {
  nlohmann::ordered_json json = {{"size", group.size}, {"paths", group.paths}};
  if (!std::all_of(group.paths.begin(), group.paths.end(), Varnel::Platform::isValidUTF8)) {
    nlohmann::ordered_json& urls = json["urls"] = nlohmann::ordered_json::array();
    for (const std::string& path : group.paths)
      urls.push_back(URL::fileURLWithPath(path).absoluteString());
  }
  return json;
}

}  // namespace

std::string textOf(const ScanResult& result, const ByteCountFormatter& byteCounts,
                   const Varnel::QNURLResolver& paths) {
  const auto size = [&](std::uint64_t bytes) {
    return byteCounts.string(static_cast<std::int64_t>(bytes), ByteCountStyle::file);
  };
  std::string text;
  for (const DuplicateGroup& group : result.groups) {
    text += std::to_string(group.paths.size()) + " files of " + size(group.size) + ", " +
            size(group.wastedBytes()) + " wasted\n";
    for (const std::string& path : group.paths)
      text += "  " + visibleText(paths.abbreviatedPath(path)) + "\n";
    text += "\n";
  }
  return text + summary(result.totals, result.groups.size(), size(result.totals.wastedBytes));
}

std::string jsonOf(const ScanResult& result) {
  const ScanTotals& totals = result.totals;
  nlohmann::ordered_json json = {
      {"folders", totals.folders},
      {"files", totals.files},
      {"bytes", totals.bytes},
      {"emptyFiles", totals.emptyFiles},
      {"hardLinks", totals.hardLinks},
      {"unreadableFiles", totals.unreadableFiles},
      {"vanishedFiles", totals.vanishedFiles},
      {"changedFiles", totals.changedFiles},
      {"unreadableFolders", totals.unreadableFolders},
      {"duplicateFiles", totals.duplicateFiles},
      {"wastedBytes", totals.wastedBytes},
      {"groups", nlohmann::ordered_json::array()},
  };
  for (const DuplicateGroup& group : result.groups) json["groups"].push_back(jsonOf(group));
  return jsonLine(json);
}

}  // namespace Orvane
