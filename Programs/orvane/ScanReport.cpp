// SPDX-License-Identifier: MIT
#include <orvane/ScanReport.h>

#include <algorithm>
#include <nlohmann/json.hpp>
#include <string_view>
#include <utility>

#include <fmt/chrono.h>

#include <Scan/ScanResult.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <orvane/CommandParts.h>
#include <orvane/JSONLine.h>
#include <orvane/JSONList.h>

namespace Orvane {
namespace {

using Json = nlohmann::ordered_json;
using Varnel::Platform::isValidUTF8;

std::string urlOf(const std::string& path) {
  return Varnel::Platform::URL::fileURLWithPath(path).absoluteString();
}

/// Adds the paths and, where one is not UTF-8, which JSON texts must be, the exact URLs of all.
void addPaths(Json& json, const char* key, const char* keyOfURLs,
              const std::vector<std::string>& paths) {
  json[key] = paths;
  if (std::all_of(paths.begin(), paths.end(), isValidUTF8)) return;
  for (const std::string& path : paths) json[keyOfURLs].push_back(urlOf(path));
}

/// Seconds, rounded down, and nanoseconds since then: a number of JSON would not hold them all.
std::string momentOf(std::int64_t nanoseconds) {
  using namespace std::chrono;
  const std::chrono::nanoseconds moment(nanoseconds);
  const auto whole = floor<seconds>(moment);
  return fmt::format("{}.{:09}", whole.count(), (moment - whole).count());
}

Json jsonOf(const DuplicateFile& file) {
  Json json = {{"path", file.path}};
  if (!isValidUTF8(file.path)) json["url"] = urlOf(file.path);
  json["inode"] = file.identity.inode;
  json["modified"] = momentOf(file.modifiedAt);
  if (!file.names.empty()) addPaths(json, "names", "nameURLs", file.names);
  if (file.isReference) json["reference"] = true;
  return json;
}

Json jsonOf(const FolderGroup& group, const ScanResult& result) {
  Json json;
  addPaths(json, "paths", "urls", result.pathsOf(group));
  json["files"] = group.files;
  json["bytes"] = group.bytes;
  json["wastedBytes"] = group.wastedBytes;
  return json;
}

Json headOf(const ScanResult& result, const ScanFacts& facts) {
  const ScanTotals& totals = result.totals;
  Json json = {{"schemaVersion", schemaVersion},
               {"partial", result.isPartial},
               {"startedAt", fmt::format("{:%Y-%m-%dT%H:%M:%SZ}", facts.startedAt)}};
  addPaths(json, "roots", "rootURLs", facts.folders);
  json.update(Json{
      {"folders", totals.folders},
      {"files", totals.files},
      {"bytes", totals.bytes},
      {"emptyFiles", totals.emptyFiles},
      {"referenceFiles", totals.referenceFiles},
      {"hardLinks", totals.hardLinks},
      {"unreadableFiles", totals.unreadableFiles},
      {"vanishedFiles", totals.vanishedFiles},
      {"changedFiles", totals.changedFiles},
      {"unreadableFolders", totals.unreadableFolders},
      {"duplicateGroups", result.groups.size()},
      {"duplicateFiles", totals.duplicateFiles},
      {"wastedBytes", totals.wastedBytes},
  });
  return json;
}

bool addGroup(TextParts& parts, const ScanResult& result, const DuplicateGroup& group) {
  const Json head = {{"size", group.size}, {"wastedBytes", group.wastedBytes}};
  const auto addFile = [&](std::size_t index, const char* comma) {
    const auto place = group.begin + static_cast<std::uint32_t>(index);
    return parts.add(comma + jsonText(jsonOf(result.fileAt(place))));
  };
  return parts.add(openJSONText(head)) && addJSONList(parts, "files", group.count, addFile) &&
         parts.add("}");
}

}  // namespace

bool writeReport(const ScanResult& result, const ScanFacts& facts, std::size_t maxGroups,
                 const TextWriter& write) {
  TextParts parts(write);
  const auto addFolders = [&](std::size_t index, const char* comma) {
    return parts.add(comma + jsonText(jsonOf(result.folderGroups[index], result)));
  };
  const auto addFiles = [&](std::size_t index, const char* comma) {
    return parts.add(comma) && addGroup(parts, result, result.groups[index]);
  };
  return parts.add(openJSONText(headOf(result, facts))) &&
         addJSONList(parts, "folderGroups", std::min(result.folderGroups.size(), maxGroups),
                     addFolders) &&
         addJSONList(parts, "groups", std::min(result.groups.size(), maxGroups), addFiles) &&
         parts.add("}\n") && parts.flush();
}

bool writePathList(const ScanResult& result, std::size_t maxGroups, const TextWriter& write) {
  const std::string_view end("\0", 1);
  TextParts parts(write);
  for (std::size_t i = 0; i < std::min(result.groups.size(), maxGroups); ++i) {
    const DuplicateGroup& group = result.groups[i];
    for (std::uint32_t file = group.begin; file < group.begin + group.count; ++file)
      if (!parts.add(result.tree->pathOf(result.files[file])) || !parts.add(end)) return false;
    if (!parts.add(end)) return false;
  }
  return parts.flush();
}

std::vector<JSONField> scanReportFields() {
  return {
      schemaVersionField,
      {"partial", "whether the scan was interrupted; what was compared by then is true"},
      {"startedAt", "when the scan began, in UTC"},
      {"roots",
       "the folders that were scanned, in the order in which they were named, without links"},
      {"rootURLs", "their exact file URLs, only where a path is not UTF-8"},
      {"folders", "how many were read"},
      {"files", "how many were found"},
      {"bytes", "of all files, hard links once"},
      {"emptyFiles", "files without content, which are no duplicates"},
      {"referenceFiles", "files that are to stay, as --keep-in says"},
      {"hardLinks", "further names of files already counted"},
      {"unreadableFiles", "files that could not be read"},
      {"vanishedFiles", "files that were gone when their turn came"},
      {"changedFiles", "files that changed meanwhile"},
      {"unreadableFolders", "folders that could not be read, or only in part"},
      {"duplicateGroups", "groups of files, also those that are not listed"},
      {"duplicateFiles",
       "files that could go: of each group all that need not stay, or all but one"},
      {"wastedBytes", "what is free once they have gone"},
      {"folderGroups[].paths", "of folders that hold the same, at every depth"},
      {"folderGroups[].urls", "exact file URLs of them, only where a path is not UTF-8"},
      {"folderGroups[].files", "how many each of them holds"},
      {"folderGroups[].bytes", "of the files of each"},
      {"folderGroups[].wastedBytes", "by the groups of files that this one stands for"},
      {"groups[].size", "of each file, in bytes"},
      {"groups[].wastedBytes",
       "what is free once all but one have gone; what lies in a hole, is shared with other files "
       "or has a name elsewhere does not count, as far as the system tells"},
      {"groups[].files[].path", "bytes that are not UTF-8 are U+FFFD, as in all paths"},
      {"groups[].files[].url", "the exact file URL, only where the path is not UTF-8"},
      {"groups[].files[].inode", "the file's number on its volume"},
      {"groups[].files[].modified",
       "when its content changed: seconds since 1970, rounded down, and nine digits of "
       "nanoseconds"},
      {"groups[].files[].names", "only where it has hard links: their paths"},
      {"groups[].files[].nameURLs", "their exact file URLs, only where one is not UTF-8"},
      {"groups[].files[].reference", "true, only where the file is to stay"},
  };
}

}  // namespace Orvane
