// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/MountInfo.h>

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <functional>
#include <optional>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace Varnel::Platform::Linux {
namespace {

constexpr std::string_view deletedSuffix = "//deleted";

// Removes the text up to the separator, and the separator, from the line; returns the text.
std::string_view takeUntil(std::string_view& rest, char separator) {
  const std::size_t end = rest.find(separator);
  const std::string_view field = rest.substr(0, end);
  rest.remove_prefix(end == std::string_view::npos ? rest.size() : end + 1);
  return field;
}

bool parseNumber(std::string_view text, int& number) {
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, number);
  return error == std::errc() && stop == end;
}

bool isOctal(char c) {
  return c >= '0' && c <= '7';
}

// The kernel writes blanks, line feeds and backslashes as "\040".
std::string unescaped(std::string_view text) {
  std::size_t backslash = text.find('\\');
  if (backslash == std::string_view::npos) return std::string(text);
  std::string result;
  result.reserve(text.size());
  for (; backslash != std::string_view::npos; backslash = text.find('\\')) {
    result += text.substr(0, backslash);
    text.remove_prefix(backslash);
    if (text.size() >= 4 && isOctal(text[1]) && isOctal(text[2]) && isOctal(text[3])) {
      result += static_cast<char>((text[1] - '0') * 64 + (text[2] - '0') * 8 + (text[3] - '0'));
      text.remove_prefix(4);
    } else {
      result += '\\';
      text.remove_prefix(1);
    }
  }
  result += text;
  return result;
}

std::optional<Mount> parseLine(std::string_view line) {
  Mount mount;
  if (!parseNumber(takeUntil(line, ' '), mount.id)) return std::nullopt;
  if (!parseNumber(takeUntil(line, ' '), mount.parentID)) return std::nullopt;
  mount.device = takeUntil(line, ' ');
  takeUntil(line, ' ');  // the folder within the file system
  const std::string_view target = takeUntil(line, ' ');
  if (!target.starts_with('/') || target.ends_with(deletedSuffix)) return std::nullopt;
  mount.target = unescaped(target);
  takeUntil(line, ' ');                                           // options
  while (!line.empty() && takeUntil(line, ' ') != "-") continue;  // optional fields
  mount.type = unescaped(takeUntil(line, ' '));
  if (mount.type.empty()) return std::nullopt;
  mount.source = unescaped(takeUntil(line, ' '));
  return mount;
}

// Looks at mounts the way a path look-up meets them. Its keys refer to the mounts that it was made
// from.
class Reachability final {
 public:
  explicit Reachability(const std::vector<Mount>& mounts) {
    for (const Mount& mount : mounts) {
      byID_.emplace(mount.id, &mount);
      if (mount.parentID != mount.id) targets_.insert({mount.parentID, mount.target});
    }
  }

  bool isOnTop(const Mount& mount) {
    return isReachable(mount) && !targets_.contains({mount.id, mount.target});
  }

 private:
  using Target = std::pair<int, std::string_view>;  // a mount's parent, and where it stands

  struct TargetHash {
    std::size_t operator()(const Target& target) const {
      return std::hash<std::string_view>{}(target.second) * 31 +
             static_cast<unsigned>(target.first);
    }
  };

  const Mount* parentOf(const Mount& mount) const {
    const auto parent = byID_.find(mount.parentID);
    return parent == byID_.end() || parent->second == &mount ? nullptr : parent->second;
  }

  bool isReachable(const Mount& mount) {
    std::vector<const Mount*> chain;
    const Mount* top = &mount;
    // Not reachable until shown otherwise, so that a table that runs in circles comes to an end.
    while (top && reachable_.emplace(top->id, false).second) {
      chain.push_back(top);
      top = parentOf(*top);
    }
    bool result = !top || reachable_[top->id];
    for (; !chain.empty(); chain.pop_back()) {
      const Mount* parent = parentOf(*chain.back());
      result = result && !(parent && isCovered(*chain.back(), *parent));
      reachable_[chain.back()->id] = result;
    }
    return reachable_[mount.id];
  }

  // A look-up that walks through the parent towards the mount leaves it earlier where another mount
  // stands on a folder above.
  bool isCovered(const Mount& mount, const Mount& parent) const {
    std::string_view folder = mount.target;
    while (folder.size() > 1) {
      folder = folder.substr(0, std::max<std::size_t>(folder.rfind('/'), 1));
      if (folder.size() < parent.target.size()) return false;
      if (targets_.contains({parent.id, folder})) return true;
    }
    return false;
  }

  std::unordered_map<int, const Mount*> byID_;
  std::unordered_set<Target, TargetHash> targets_;
  std::unordered_map<int, bool> reachable_;
};

}  // namespace

std::vector<Mount> parseMountInfo(std::string_view bytes) {
  std::vector<Mount> mounts;
  while (!bytes.empty())
    if (auto mount = parseLine(takeUntil(bytes, '\n'))) mounts.push_back(*std::move(mount));
  return mounts;
}

std::vector<Mount> reachableMounts(const std::vector<Mount>& mounts) {
  Reachability reachability(mounts);
  std::vector<Mount> result;
  for (const Mount& mount : mounts)
    if (reachability.isOnTop(mount)) result.push_back(mount);
  return result;
}

}  // namespace Varnel::Platform::Linux
