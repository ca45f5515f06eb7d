// SPDX-License-Identifier: MIT
#include <Scan/PathOrder.h>

#include <algorithm>
#include <cstring>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace Orvane {
namespace {

/// Whether a path with the first name precedes one with the second in its place. A folder's name
/// goes on with "/", which a byte of a longer name may precede. Of two given folders the one around
/// the other comes first.
bool namePrecedes(const char* first, char afterFirst, const char* second, char afterSecond) {
  while (*first != '\0' && *first == *second) ++first, ++second;
  const auto byte = [](const char* at, char after) {
    return static_cast<unsigned char>(*at != '\0' ? *at : after);
  };
  const auto ofFirst = byte(first, afterFirst), ofSecond = byte(second, afterSecond);
  return ofFirst < ofSecond || (ofFirst == ofSecond && *first == '\0' && *second != '\0');
}

bool folderPrecedes(const Folder* first, const Folder* second) {
  return namePrecedes(first->name, '/', second->name, '/');
}

/// The files below a given folder, sorted.
struct Part {
  const Folder* root;
  std::vector<FileNumber> files;
};

/// The way down the tree. Invariant: what was put out precedes all that is left.
class Descent final {
 public:
  Descent(const FileTree& tree, std::vector<FileNumber>& files) : tree_(tree), files_(files) {
    std::sort(files_.begin(), files_.end(), [&](FileNumber a, FileNumber b) {
      const std::uint32_t folderOfA = tree_.file(a).folder, folderOfB = tree_.file(b).folder;
      if (folderOfA != folderOfB) return folderOfA < folderOfB;
      return std::strcmp(tree_.nameOf(a), tree_.nameOf(b)) < 0;
    });
    collectFolders();
  }

  /// A part for each given folder that has files, sorted by its path with a "/" at the end.
  std::vector<Part> run() {
    std::vector<Part> parts;
    for (const Folder* root : childrenOf(nullptr)) {
      parts.push_back({root, {}});
      descend(*root, parts.back().files);
    }
    return parts;
  }

 private:
  struct Level {
    std::span<const FileNumber> files;
    std::span<const Folder* const> folders;
  };

  /// Finds the folders on the way to the files, and sorts them by parent and name.
  void collectFolders() {
    std::vector<bool> isKnown(tree_.folders().size());
    for (const FileNumber file : files_) {
      const Folder* folder = &tree_.folderOf(file);
      for (; folder && !isKnown[folder->number]; folder = folder->parent) {
        isKnown[folder->number] = true;
        folders_.push_back(folder);
      }
    }
    std::sort(folders_.begin(), folders_.end(), [](const Folder* a, const Folder* b) {
      return a->parent != b->parent ? rankOf(a->parent) < rankOf(b->parent) : folderPrecedes(a, b);
    });
  }

  static std::uint64_t rankOf(const Folder* parent) {
    return parent ? std::uint64_t{parent->number} + 1 : 0;
  }

  [[nodiscard]] std::span<const Folder* const> childrenOf(const Folder* parent) const {
    const auto begin = std::lower_bound(
        folders_.begin(), folders_.end(), rankOf(parent),
        [](const Folder* folder, std::uint64_t rank) { return rankOf(folder->parent) < rank; });
    const auto end = std::find_if(begin, folders_.end(),
                                  [&](const Folder* folder) { return folder->parent != parent; });
    return {begin, end};
  }

  [[nodiscard]] std::span<const FileNumber> filesIn(const Folder& folder) const {
    const auto begin = std::lower_bound(
        files_.begin(), files_.end(), folder.number,
        [&](FileNumber file, std::uint32_t number) { return tree_.file(file).folder < number; });
    const auto end = std::find_if(begin, files_.end(), [&](FileNumber file) {
      return tree_.file(file).folder != folder.number;
    });
    return {begin, end};
  }

  void descend(const Folder& root, std::vector<FileNumber>& sorted) const {
    std::vector<Level> levels{{filesIn(root), childrenOf(&root)}};
    while (!levels.empty()) {
      Level& level = levels.back();
      if (!level.files.empty() &&
          (level.folders.empty() || namePrecedes(tree_.nameOf(level.files.front()), '\0',
                                                 level.folders.front()->name, '/'))) {
        sorted.push_back(level.files.front());
        level.files = level.files.subspan(1);
      } else if (!level.folders.empty()) {
        const Folder& next = *level.folders.front();
        level.folders = level.folders.subspan(1);
        levels.push_back({filesIn(next), childrenOf(&next)});
      } else {
        levels.pop_back();
      }
    }
  }

  const FileTree& tree_;
  std::vector<FileNumber>& files_;
  std::vector<const Folder*> folders_;
};

/// Merges runs of files that stand one after the other; the last of the ends is that of all.
void mergeRuns(const FileTree& tree, std::vector<FileNumber>& files, std::vector<std::size_t> ends,
               std::size_t begin) {
  const auto at = [&](std::size_t index) {
    return files.begin() + static_cast<std::ptrdiff_t>(index);
  };
  while (ends.size() > 1) {
    std::vector<std::size_t> merged;
    for (std::size_t i = 0; i < ends.size(); i += 2) {
      const std::size_t first = merged.empty() ? begin : merged.back();
      merged.push_back(ends[std::min(i + 1, ends.size() - 1)]);
      std::inplace_merge(
          at(first), at(ends[i]), at(merged.back()),
          [&](FileNumber a, FileNumber b) { return tree.pathOf(a) < tree.pathOf(b); });
    }
    ends = std::move(merged);
  }
}

}  // namespace

void sortByPath(const FileTree& tree, std::vector<FileNumber>& files) {
  const std::vector<Part> parts = Descent(tree, files).run();
  files.clear();
  // The files of a given folder stand amid those of another one around it, which comes before.
  for (auto part = parts.begin(); part != parts.end();) {
    const std::string around = part->root->name + std::string("/");
    const std::size_t begin = files.size();
    std::vector<std::size_t> ends;
    do {
      files.insert(files.end(), part->files.begin(), part->files.end());
      ends.push_back(files.size());
      ++part;
    } while (part != parts.end() && std::string_view(part->root->name).starts_with(around));
    mergeRuns(tree, files, std::move(ends), begin);
  }
}

}  // namespace Orvane
