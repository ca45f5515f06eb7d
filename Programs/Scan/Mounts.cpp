// SPDX-License-Identifier: MIT
#include <Scan/Mounts.h>

#include <algorithm>

namespace Orvane {
namespace {

std::string withSlash(std::string_view folder) {
  return std::string(folder) + (folder.ends_with('/') ? "" : "/");
}

bool precedes(const ScanMount& mount, const std::string& folder) {
  return withSlash(mount.path) < folder;
}

}  // namespace

bool liesIn(std::string_view path, std::string_view folder) {
  return path == folder || path.starts_with(withSlash(folder));
}

Mounts::Mounts(std::vector<ScanMount> mounts) : mounts_(std::move(mounts)) {
  std::sort(mounts_.begin(), mounts_.end(),
            [](const ScanMount& a, const ScanMount& b) { return precedes(a, withSlash(b.path)); });
}

const ScanMount* Mounts::at(std::string_view folder) const {
  const auto found = std::lower_bound(mounts_.begin(), mounts_.end(), withSlash(folder), precedes);
  return found != mounts_.end() && withSlash(found->path) == withSlash(folder) ? &*found : nullptr;
}

const ScanMount* Mounts::around(std::string_view path) const {
  while (!path.empty()) {
    if (const ScanMount* mount = at(path)) return mount;
    path = path.substr(0, path.rfind('/'));
  }
  return at("/");
}

Mounts::Iterator Mounts::firstBelow(std::string_view folder) const {
  const auto begin = std::lower_bound(mounts_.begin(), mounts_.end(), withSlash(folder), precedes);
  return begin != mounts_.end() && withSlash(begin->path) == withSlash(folder) ? begin + 1 : begin;
}

bool Mounts::hasBelow(std::string_view folder) const {
  const auto first = firstBelow(folder);
  return first != mounts_.end() && liesIn(first->path, folder);
}

std::vector<const ScanMount*> Mounts::nextBelow(std::string_view folder) const {
  std::vector<const ScanMount*> next;
  for (auto each = firstBelow(folder); each != mounts_.end() && liesIn(each->path, folder); ++each)
    if (next.empty() || !liesIn(each->path, next.back()->path)) next.push_back(&*each);
  return next;
}

}  // namespace Orvane
