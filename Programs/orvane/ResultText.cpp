// SPDX-License-Identifier: MIT
#include <orvane/ResultText.h>

#include <algorithm>
#include <nlohmann/json.hpp>
#include <string>
#include <utility>

#include <Scan/ScanResult.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <orvane/JSONLine.h>

namespace Orvane {
namespace {

using Varnel::Platform::ByteCountFormatter;
using Varnel::Platform::ByteCountStyle;
using Varnel::Platform::URL;
using Varnel::Platform::visibleText;

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

nlohmann::ordered_json jsonOf(const DuplicateGroup& group, const std::vector<std::string>& paths) {
  nlohmann::ordered_json json = {{"size", group.size}, {"paths", paths}};
  if (!std::all_of(paths.begin(), paths.end(), Varnel::Platform::isValidUTF8)) {
    nlohmann::ordered_json& urls = json["urls"] = nlohmann::ordered_json::array();
    for (const std::string& path : paths)
      urls.push_back(URL::fileURLWithPath(path).absoluteString());
  }
  return json;
}

/// Collects text and hands it on in parts.
class Parts final {
 public:
  explicit Parts(const TextWriter& write) : write_(write) {}

  /// False once the writer has failed.
  [[nodiscard]] bool add(std::string_view text) {
    part_ += text;
    return part_.size() < maxPart || flush();
  }

  [[nodiscard]] bool flush() {
    const bool isWritten = write_(part_);
    part_.clear();
    return isWritten;
  }

 private:
  static constexpr std::size_t maxPart = 64 * 1024;

  const TextWriter& write_;
  std::string part_;
};

}  // namespace

std::string counted(std::uint64_t count, const char* singular, const char* plural) {
  return std::to_string(count) + " " + (count == 1 ? singular : plural);
}

bool writeText(const ScanResult& result, const ByteCountFormatter& byteCounts,
               const Varnel::QNURLResolver& paths, const TextWriter& write) {
  const auto size = [&](std::uint64_t bytes) {
    return byteCounts.string(static_cast<std::int64_t>(bytes), ByteCountStyle::file);
  };
  Parts parts(write);
  for (const DuplicateGroup& group : result.groups) {
    std::string text = std::to_string(group.count) + " files of " + size(group.size) + ", " +
                       size(group.wastedBytes) + " wasted\n";
    for (const std::string& path : result.pathsOf(group))
      text += "  " + visibleText(paths.abbreviatedPath(path)) + "\n";
    if (!parts.add(text + "\n")) return false;
  }
  return parts.add(summary(result.totals, result.groups.size(), size(result.totals.wastedBytes))) &&
         parts.flush();
}

bool writeJSON(const ScanResult& result, const TextWriter& write) {
  const ScanTotals& totals = result.totals;
  std::string head = jsonLine({
      {"schemaVersion", schemaVersion},
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
  });
  const std::string_view tail = "]}\n";
  head.resize(head.size() - tail.size());
  Parts parts(write);
  if (!parts.add(head)) return false;
  for (bool isFirst = true; const DuplicateGroup& group : result.groups) {
    std::string text = jsonLine(jsonOf(group, result.pathsOf(group)));
    text.pop_back();  // The end of the line.
    if (!parts.add((std::exchange(isFirst, false) ? "" : ",") + text)) return false;
  }
  return parts.add(tail) && parts.flush();
}

}  // namespace Orvane
