// SPDX-License-Identifier: MIT
#include <Scan/FolderGroups.h>

#define XXH_INLINE_ALL
#include <xxhash.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <span>
#include <string>
#include <tuple>

#include <Scan/ContentReader.h>

namespace Orvane {
namespace {

enum class EntryKind : unsigned char { file, folder };

/// What is below a folder, in a form that does not depend on the order in which it is added.
struct Contents {
  Digest digest{};  ///< The sum of the digests of all entries.
  std::uint64_t bytes = 0;
  std::uint64_t files = 0;
  bool isKnown = false;  ///< Whether nothing is missing.
};

/// The comparison of all folders of a tree. Invariant while folders are added: those with a number
/// above the present one have everything that is below them.
class Comparison final {
 public:
  Comparison(const FileTree& tree, const std::vector<std::uint32_t>& contents)
      : tree_(tree), contents_(contents), sums_(tree.folders().size()) {
    for (const Folder& folder : tree.folders()) sums_[folder.number].isKnown = folder.isWhole;
    tree.forEachFile([&](FileNumber number, const FileRecord& record) { add(number, record); });
    // A folder's number is above that of the one it is in.
    for (std::size_t number = sums_.size(); number-- > 0;) add(tree.folders()[number]);
  }

  [[nodiscard]] const Contents& of(std::uint32_t folder) const { return sums_[folder]; }

  /// The folders that have content, and nothing unknown, those of the same side by side.
  [[nodiscard]] std::vector<std::uint32_t> sorted() const {
    std::vector<std::uint32_t> folders;
    for (std::uint32_t number = 0; number < sums_.size(); ++number)
      if (sums_[number].isKnown && sums_[number].bytes > 0) folders.push_back(number);
    std::sort(folders.begin(), folders.end(), [&](std::uint32_t a, std::uint32_t b) {
      return std::tie(sums_[a].digest, identityOf(a)) < std::tie(sums_[b].digest, identityOf(b));
    });
    return folders;
  }

  [[nodiscard]] const FileIdentity& identityOf(std::uint32_t folder) const {
    return tree_.folders()[folder].identity;
  }

 private:
  static constexpr std::uint32_t emptyContent = std::numeric_limits<std::uint32_t>::max();

  void add(FileNumber number, const FileRecord& record) {
    Contents& sum = sums_[record.folder];
    if (!sum.isKnown) return;
    const std::uint32_t content = record.size == 0 ? emptyContent : contents_[number];
    sum.isKnown = content != 0;
    if (!sum.isKnown) return;
    addEntry(sum, tree_.nameOf(number), EntryKind::file, {content, record.size});
    sum.bytes += record.size;
    ++sum.files;
  }

  void add(const Folder& folder) {
    if (!folder.parent) return;
    const Contents& sum = sums_[folder.number];
    Contents& above = sums_[folder.parent->number];
    above.isKnown = above.isKnown && sum.isKnown;
    if (!above.isKnown) return;
    addEntry(above, folder.name, EntryKind::folder, sum.digest);
    above.bytes += sum.bytes;
    above.files += sum.files;
  }

  void addEntry(Contents& sum, const char* name, EntryKind kind, const Digest& content) {
    entry_ = name;
    entry_ += static_cast<char>(kind);
    std::array<char, sizeof content> bytes;
    std::memcpy(bytes.data(), content.data(), bytes.size());
    entry_.append(bytes.data(), bytes.size());
    const std::span<const std::byte> secret = secret_.bytes();
    const XXH128_hash_t hash =
        XXH3_128bits_withSecret(entry_.data(), entry_.size(), secret.data(), secret.size());
    sum.digest[0] += hash.high64;
    sum.digest[1] += hash.low64;
  }

  const FileTree& tree_;
  const std::vector<std::uint32_t>& contents_;
  const DigestSecret secret_;
  std::vector<Contents> sums_;
  std::string entry_;  ///< The last one that was added.
};

/// The classes of a comparison, made into groups.
class Grouping final {
 public:
  Grouping(ScanResult& result, const Comparison& comparison)
      : result_(result), tree_(*result.tree), comparison_(comparison) {}

  void run() {
    result_.folderClasses.resize(tree_.folders().size());
    std::vector<std::uint32_t> folders = comparison_.sorted();
    for (auto begin = folders.begin(); begin != folders.end();) {
      const auto end = std::find_if(begin, folders.end(), [&](std::uint32_t folder) {
        return comparison_.of(folder).digest != comparison_.of(*begin).digest;
      });
      addClass(std::span(begin, end));
      begin = end;
    }
    for (const auto& members : classes_) list(members);
    countWaste();
    sort();
  }

 private:
  using Members = std::vector<std::uint32_t>;

  [[nodiscard]] std::string pathAt(std::uint32_t folder) const {
    return pathOf(tree_.folders()[folder]);
  }

  void addClass(std::span<const std::uint32_t> folders) {
    Members members;
    for (const std::uint32_t folder : folders) {
      // One that is mounted at two places is one.
      if (members.empty() ||
          comparison_.identityOf(members.back()) != comparison_.identityOf(folder)) {
        members.push_back(folder);
      } else if (pathAt(folder) < pathAt(members.back())) {
        members.back() = folder;
      }
    }
    if (members.size() < 2) return;
    classes_.push_back(std::move(members));
    for (const std::uint32_t folder : classes_.back())
      result_.folderClasses[folder] = static_cast<std::uint32_t>(classes_.size());
  }

  /// Makes a group of the class, unless another one says that already.
  void list(const Members& members) {
    Members around;
    for (const std::uint32_t folder : members)
      if (const Folder* const above = tree_.folders()[folder].parent)
        around.push_back(above->number);
    const bool isImplied =
        around.size() == members.size() && areOfOneClass(std::move(around), result_.folderClasses);
    listed_.push_back(isImplied ? none : result_.folderGroups.size());
    if (isImplied) return;
    const Contents& contents = comparison_.of(members.front());
    result_.folderGroups.push_back({.bytes = contents.bytes,
                                    .files = contents.files,
                                    .begin = static_cast<std::uint32_t>(result_.folders.size()),
                                    .count = static_cast<std::uint32_t>(members.size())});
    std::vector<std::pair<std::string, std::uint32_t>> byPath;
    for (const std::uint32_t folder : members) byPath.emplace_back(pathAt(folder), folder);
    std::sort(byPath.begin(), byPath.end());
    for (const auto& [path, folder] : byPath) result_.folders.push_back(folder);
  }

  /// Gives what implied groups of files waste to the group of folders that says it.
  void countWaste() {
    for (const DuplicateGroup& group : result_.groups) {
      if (!result_.isImplied(group)) continue;
      std::uint32_t number =
          result_.folderClasses[tree_.folderOf(result_.files[group.begin]).number];
      while (listed_[number - 1] == none) {
        const std::uint32_t folder = classes_[number - 1].front();
        number = result_.folderClasses[tree_.folders()[folder].parent->number];
      }
      result_.folderGroups[listed_[number - 1]].wastedBytes += group.wastedBytes;
    }
  }

  void sort() {
    const auto firstPath = [&](const FolderGroup& group) {
      return pathAt(result_.folders[group.begin]);
    };
    std::sort(result_.folderGroups.begin(), result_.folderGroups.end(),
              [&](const FolderGroup& a, const FolderGroup& b) {
                if (a.wastedBytes != b.wastedBytes) return a.wastedBytes > b.wastedBytes;
                return firstPath(a) < firstPath(b);
              });
  }

  static constexpr std::size_t none = std::numeric_limits<std::size_t>::max();

  ScanResult& result_;
  const FileTree& tree_;
  const Comparison& comparison_;
  std::vector<Members> classes_;
  std::vector<std::size_t> listed_;  ///< For each class its place among the groups, or none.
};

}  // namespace

void findFolderGroups(ScanResult& result, const std::vector<std::uint32_t>& contents) {
  Grouping(result, Comparison(*result.tree, contents)).run();
}

bool areOfOneClass(std::vector<std::uint32_t> folders, const std::vector<std::uint32_t>& classes) {
  for (const std::uint32_t folder : folders)
    if (classes[folder] == 0 || classes[folder] != classes[folders.front()]) return false;
  std::sort(folders.begin(), folders.end());
  return std::adjacent_find(folders.begin(), folders.end()) == folders.end();
}

}  // namespace Orvane
