// SPDX-License-Identifier: MIT
#include <orvane/ResultText.h>

#include <algorithm>
#include <vector>

#include <Scan/ScanResult.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/ShownText.h>

namespace Orvane {
namespace {

using Varnel::Platform::ByteCountFormatter;
using Varnel::Platform::ByteCountStyle;

/// A group to show: one of the two.
struct Entry {
  const FolderGroup* folders = nullptr;
  const DuplicateGroup* files = nullptr;

  [[nodiscard]] std::uint64_t wastedBytes() const {
    return folders ? folders->wastedBytes : files->wastedBytes;
  }
};

/// What is to be shown, most wasted bytes first; folders before files of the same waste.
std::vector<Entry> entriesOf(const ScanResult& result, std::size_t max) {
  std::vector<Entry> entries;
  auto folders = result.folderGroups.begin();
  const auto addFolders = [&](std::uint64_t wastedBytes) {
    for (; folders != result.folderGroups.end() && folders->wastedBytes >= wastedBytes; ++folders)
      entries.push_back({.folders = &*folders});
  };
  for (const DuplicateGroup& group : result.groups) {
    if (entries.size() >= max) break;
    addFolders(group.wastedBytes);
    if (!result.isImplied(group)) entries.push_back({.files = &group});
  }
  addFolders(0);
  entries.resize(std::min(entries.size(), max));
  return entries;
}

class Text final {
 public:
  Text(const ScanResult& result, const TextForm& form, const ByteCountFormatter& byteCounts,
       const Varnel::QNURLResolver& paths, const TextWriter& write)
      : result_(result), form_(form), byteCounts_(byteCounts), paths_(paths), parts_(write) {}

  [[nodiscard]] bool write() {
    std::vector<Entry> entries = entriesOf(result_, form_.maxGroups);
    if (form_.endsWithMost) std::reverse(entries.begin(), entries.end());
    for (const Entry& entry : entries) {
      if (form_.shouldStop()) break;
      if (!(entry.folders ? add(*entry.folders) : add(*entry.files))) return false;
    }
    return parts_.add(prominent(summary())) && parts_.flush();
  }

 private:
  [[nodiscard]] bool add(const FolderGroup& group) {
    std::string head = std::to_string(group.count) + " folders of " +
                       counted(group.files, "file", "files") + " and " + size(group.bytes);
    // Where it wastes nothing, the groups of files say what they do.
    if (group.wastedBytes > 0) head += ", " + wasted(group.wastedBytes);
    std::string text = prominent(head);
    for (const std::string& path : result_.pathsOf(group))
      text += "  " + line(path.ends_with('/') ? path : path + "/");
    return parts_.add(text + "\n");
  }

  [[nodiscard]] bool add(const DuplicateGroup& group) {
    const std::string head = std::to_string(group.count) + " files of " + size(group.size) + ", " +
                             wasted(group.wastedBytes);
    if (!parts_.add(prominent(head))) return false;
    for (std::uint32_t i = 0; i < group.count && !form_.shouldStop(); ++i) {
      const DuplicateFile file = result_.fileAt(group.begin + i);
      std::string text = (file.isReference ? "* " : "  ") + line(file.path);
      for (const std::string& name : file.names) text += "    also " + line(name);
      if (!parts_.add(text)) return false;
    }
    return parts_.add("\n");
  }

  [[nodiscard]] std::string summary() const {
    const ScanTotals& totals = result_.totals;
    std::string text = result_.isPartial ? "interrupted; so far " : "";
    text += counted(totals.files, "file", "files") + " in " +
            counted(totals.folders, "folder", "folders") + ": ";
    if (result_.groups.empty()) {
      text += "no duplicates";
    } else {
      text += counted(totals.duplicateFiles, "duplicate", "duplicates") + " in " +
              counted(result_.groups.size(), "group", "groups") + ", " + wasted(totals.wastedBytes);
    }
    const auto add = [&](std::uint64_t count, const char* singular, const char* plural) {
      if (count > 0) text += "; " + counted(count, singular, plural);
    };
    add(result_.folderGroups.size(), "group of folders that hold the same",
        "groups of folders that hold the same");
    add(totals.referenceFiles, "of the files is to stay", "of the files are to stay");
    add(totals.unreadableFiles, "file could not be read", "files could not be read");
    add(totals.vanishedFiles, "file vanished", "files vanished");
    add(totals.changedFiles, "file changed meanwhile", "files changed meanwhile");
    add(totals.unreadableFolders, "folder could not be read", "folders could not be read");
    return text;
  }

  [[nodiscard]] std::string line(const std::string& path) const {
    return Varnel::Platform::visibleText(paths_.abbreviatedPath(path)) + "\n";
  }

  [[nodiscard]] std::string size(std::uint64_t bytes) const {
    return byteCounts_.string(static_cast<std::int64_t>(bytes), ByteCountStyle::file);
  }
  [[nodiscard]] std::string wasted(std::uint64_t bytes) const {
    return bytes == 0 ? "nothing wasted" : size(bytes) + " wasted";
  }

  /// In lines of the form's columns.
  [[nodiscard]] std::string prominent(const std::string& words) const {
    const std::string text = wrapped(words, form_.columns);
    return form_.isBold ? "\x1b[1m" + text + "\x1b[0m\n" : text + "\n";
  }

  const ScanResult& result_;
  const TextForm& form_;
  const ByteCountFormatter& byteCounts_;
  const Varnel::QNURLResolver& paths_;
  TextParts parts_;
};

}  // namespace

bool writeText(const ScanResult& result, const TextForm& form, const ByteCountFormatter& byteCounts,
               const Varnel::QNURLResolver& paths, const TextWriter& write) {
  return Text(result, form, byteCounts, paths, write).write();
}

}  // namespace Orvane
