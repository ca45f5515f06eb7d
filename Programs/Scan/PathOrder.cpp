// SPDX-License-Identifier: MIT
#include <Scan/PathOrder.h>

#include <algorithm>
#include <cstring>
#include <span>
#include <string_view>

namespace Orvane {
namespace {

/// Whether a path with the first name precedes one with the second in its place. A folder's name
/// goes on with "/", which a byte of a longer name may precede.
bool namePrecedes(const char* first, char afterFirst, const char* second, char afterSecond) {
  while (*first != '\0' && *first == *second) ++first, ++second;
  const auto byte = [](const char* at, char after) {
    return static_cast<unsigned char>(*at != '\0' ? *at : after);
  };
  return byte(first, afterFirst) < byte(second, afterSecond);
}

bool folderPrecedes(const Folder* first, const Folder* second) {
  return namePrecedes(first->name, '/', second->name, '/');
}

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

  /// The files below each given folder, one after the other.
  std::vector<std::vector<FileNumber>> run() {
    std::vector<std::vector<FileNumber>> sorted;
    for (const Folder* root : childrenOf(nullptr)) {
      sorted.emplace_back();
      descend(*root, sorted.back());
    }
    return sorted;
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

/// Whether the given folder of the second file lies in that of the first.
bool liesIn(const FileTree& tree, FileNumber outer, FileNumber inner) {
  const auto rootOf = [&](FileNumber file) {
    const Folder* folder = &tree.folderOf(file);
    while (folder->parent) folder = folder->parent;
    return std::string_view(folder->name);
  };
  return rootOf(inner).starts_with(std::string(rootOf(outer)) + "/");
}

}  // namespace

void sortByPath(const FileTree& tree, std::vector<FileNumber>& files) {
  std::vector<std::vector<FileNumber>> parts = Descent(tree, files).run();
  std::erase_if(parts, [](const auto& part) { return part.empty(); });
  files.clear();
  for (const std::vector<FileNumber>& part : parts) {
    const auto middle = files.insert(files.end(), part.begin(), part.end());
    // The files of a given folder stand amid those of another one around it.
    const bool isNested = std::any_of(parts.begin(), parts.end(), [&](const auto& other) {
      return liesIn(tree, other.front(), part.front()) || liesIn(tree, part.front(), other.front());
    });
    if (isNested)
      std::inplace_merge(files.begin(), middle, files.end(), [&](FileNumber a, FileNumber b) {
        return tree.pathOf(a) < tree.pathOf(b);
      });
  }
}

}  // namespace Orvane
