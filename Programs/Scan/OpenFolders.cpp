// SPDX-License-Identifier: MIT
#include <Scan/OpenFolders.h>

#include <algorithm>
#include <string>

#include <Scan/FileTree.h>

namespace Orvane {
namespace {

/// The names that lead from the one folder down to the other, or its whole path from none.
std::string wayDown(const Folder* from, const Folder& to) {
  if (!from) return pathOf(to);
  std::vector<const Folder*> steps;
  for (const Folder* each = &to; each != from; each = each->parent) steps.push_back(each);
  std::string way;
  for (auto step = steps.rbegin(); step != steps.rend(); ++step) {
    if (!way.empty()) way += '/';
    way += (*step)->name;
  }
  return way;
}

}  // namespace

FileResult<OpenFolder*> OpenFolders::open(const Folder& folder) {
  if (Entry* known = find(&folder)) {
    std::rotate(entries_.begin() + (known - entries_.data()),
                entries_.begin() + (known - entries_.data()) + 1, entries_.end());
    return entries_.back().open.get();
  }
  const Folder* above = folder.parent;
  Entry* base = nullptr;
  while (above && !(base = find(above))) above = above->parent;
  auto opened = fileSystem_.openFolder(base ? base->open.get() : nullptr, wayDown(above, folder));
  if (!opened && opened.error() == std::errc::too_many_files_open) {
    doWithFew();
    entries_.clear();
    opened = fileSystem_.openFolder(nullptr, pathOf(folder));
  }
  if (!opened) return opened.error();
  if (entries_.size() == maxCount_) entries_.erase(entries_.begin());
  entries_.push_back({&folder, std::move(*opened)});
  return entries_.back().open.get();
}

void OpenFolders::doWithFew() {
  maxCount_ = 1;
  if (entries_.size() > 1) entries_.erase(entries_.begin(), entries_.end() - 1);
}

OpenFolders::Entry* OpenFolders::find(const Folder* folder) {
  const auto found = std::find_if(entries_.rbegin(), entries_.rend(),
                                  [&](const Entry& entry) { return entry.folder == folder; });
  return found == entries_.rend() ? nullptr : &*found;
}

}  // namespace Orvane
