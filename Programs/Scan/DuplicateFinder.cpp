// SPDX-License-Identifier: MIT
#include <Scan/DuplicateFinder.h>

#include <algorithm>
#include <tuple>
#include <utility>

#include <Scan/FileReading.h>
#include <Scan/FolderGroups.h>
#include <Scan/FolderWalk.h>
#include <Scan/PathOrder.h>
#include <Scan/ScanObserver.h>
#include <Scan/SharedSpace.h>
#include <Scan/Waste.h>

namespace Orvane {
namespace {

using Candidates = std::vector<Candidate>;

/// Calls `use(begin, end)` for each run of candidates that are equal in the key that is given.
template <typename Iterator, typename KeyOf, typename Use>
void forEachRun(Iterator begin, Iterator end, const KeyOf& keyOf, const Use& use) {
  while (begin != end) {
    const auto next = std::find_if(
        begin, end, [&](const Candidate& candidate) { return keyOf(candidate) != keyOf(*begin); });
    use(begin, next);
    begin = next;
  }
}

auto groupAndKey(const Candidate& candidate) {
  return std::tie(candidate.group, candidate.key);
}

/// Takes out the candidates that a condition holds for.
template <typename Condition>
Candidates takeOut(Candidates& candidates, const Condition& condition) {
  const auto middle = std::stable_partition(candidates.begin(), candidates.end(),
                                            [&](const auto& each) { return !condition(each); });
  Candidates taken(middle, candidates.end());
  candidates.erase(middle, candidates.end());
  return taken;
}

/// One scan, on the thread that runs it.
class Scan final {
 public:
  Scan(DuplicateFinder::Ports ports, ScanControl& control) : ports_(ports), control_(control) {}

  ScanResult run(const ScanRequest& request) {
    hasReferences_ = !request.references.empty();
    WalkResult walk =
        walkFolders(request, ports_.fileSystem, ports_.turns, ports_.observer, control_);
    if (!walk.lostRoots.empty()) return {.lostFolders = std::move(walk.lostRoots)};
    tree_ = walk.tree;
    reportWalk(walk);
    Candidates candidates = distinctFiles();
    keepSharedSizes(candidates);
    FileReading reading({*tree_, ports_.fileSystem, ports_.turns}, control_);
    std::vector<Candidates> equal = readEqual(reading, std::move(candidates));
    totals_.unreachedFiles = reading.unreachedFiles();
    return resultFrom(std::move(equal), reading.takeFootprints());
  }

 private:
  void reportWalk(const WalkResult& walk) {
    totals_.folders = walk.folders;
    totals_.unreadableFolders = walk.unreadableFolders.size();
    totals_.files = tree_->fileCount() + walk.unreadableFiles.size();
    for (const LostPath& lost : walk.unreadableFolders)
      ports_.observer.folderLeftOut(lost.path, lost.loss);
    for (const LostPath& lost : walk.unreadableFiles) leaveOut(lost.path, lost.loss);
  }

  void leaveOut(const std::string& path, const Loss& loss) {
    switch (loss.kind) {
      case Loss::Kind::unreadable:
      case Loss::Kind::incomplete:
        ++totals_.unreadableFiles;
        break;
      case Loss::Kind::vanished:
        ++totals_.vanishedFiles;
        break;
      case Loss::Kind::changed:
        ++totals_.changedFiles;
        break;
    }
    ports_.observer.fileLeftOut(path, loss);
  }

  [[nodiscard]] bool isToStay(FileNumber file) const {
    return hasReferences_ && tree_->folderOf(file).isReference;
  }

  template <typename Iterator>
  [[nodiscard]] bool areAllToStay(Iterator begin, Iterator end) const {
    return hasReferences_ &&
           std::all_of(begin, end, [&](const Candidate& each) { return isToStay(each.file); });
  }

  [[nodiscard]] std::uint64_t sizeOf(const Candidate& candidate) const {
    return tree_->file(candidate.file).size;
  }

  /// The files that have content, each under its first path, sorted by location.
  Candidates distinctFiles() {
    Candidates files;
    files.reserve(tree_->fileCount());
    tree_->forEachFile([&](FileNumber number, const FileRecord& record) {
      if (isToStay(number)) ++totals_.referenceFiles;
      if (record.size == 0) {
        ++totals_.emptyFiles;
      } else {
        files.push_back({.file = number, .key = tree_->locationOf(number)});
      }
    });
    std::sort(files.begin(), files.end(), [](const Candidate& a, const Candidate& b) {
      return std::tie(a.key, a.file) < std::tie(b.key, b.file);
    });
    keepFirstLinks(files);
    for (const Candidate& file : files) totals_.bytes += sizeOf(file);
    return files;
  }

  void keepFirstLinks(Candidates& files) {
    const auto keyOf = [](const Candidate& candidate) { return candidate.key; };
    std::vector<FileNumber> links;
    forEachRun(files.begin(), files.end(), keyOf, [&](auto begin, auto end) {
      if (end - begin > 1)
        for (; begin != end; ++begin) links.push_back(begin->file);
    });
    if (links.empty()) return;
    sortByPath(*tree_, links);
    // Each file's first path comes first now, if need be of those that are to stay, and the files
    // in the order of the candidates.
    const auto rankOf = [&](FileNumber link) {
      return std::pair(tree_->locationOf(link), !isToStay(link));
    };
    std::stable_sort(links.begin(), links.end(),
                     [&](FileNumber a, FileNumber b) { return rankOf(a) < rankOf(b); });
    auto link = links.begin();
    auto kept = files.begin();
    forEachRun(files.begin(), files.end(), keyOf, [&](auto begin, auto end) {
      *kept = *begin;
      if (end - begin > 1) {
        kept->file = *link;
        for (const auto last = link + (end - begin); ++link != last;)
          links_.push_back({.file = kept->file, .name = *link});
      }
      ++kept;
    });
    std::stable_sort(links_.begin(), links_.end(),
                     [](const FileLink& a, const FileLink& b) { return a.file < b.file; });
    totals_.hardLinks = static_cast<std::uint64_t>(files.end() - kept);
    files.erase(kept, files.end());
  }

  /// Leaves the files whose size others have too, unless all of them are to stay, and makes a group
  /// of each size.
  void keepSharedSizes(Candidates& files) const {
    // Behind each size whether a file may go, so that the one that may is the last of its size.
    std::vector<std::uint64_t> sizes;
    sizes.reserve(files.size());
    for (const Candidate& file : files) sizes.push_back(sizeOf(file) << 1 | !isToStay(file.file));
    std::sort(sizes.begin(), sizes.end());
    auto kept = sizes.begin();
    for (auto begin = sizes.begin(); begin != sizes.end();) {
      const auto end = std::upper_bound(begin, sizes.end(), *begin | 1);
      if (end - begin > 1 && (*(end - 1) & 1) != 0) *kept++ = *begin >> 1;
      begin = end;
    }
    sizes.erase(kept, sizes.end());
    std::erase_if(files, [&](Candidate& file) {
      const auto found = std::lower_bound(sizes.begin(), sizes.end(), sizeOf(file));
      file.group = static_cast<std::uint32_t>(found - sizes.begin());
      return found == sizes.end() || *found != sizeOf(file);
    });
    files.shrink_to_fit();
  }

  /// Leaves the groups of candidates that agree in group and key, at least two of which one may go,
  /// and gives them numbers of their own.
  void keepAgreeing(Candidates& candidates) const {
    std::sort(candidates.begin(), candidates.end(), [](const Candidate& a, const Candidate& b) {
      return groupAndKey(a) < groupAndKey(b);
    });
    std::uint32_t group = 0;
    auto kept = candidates.begin();
    forEachRun(candidates.begin(), candidates.end(), groupAndKey, [&](auto begin, auto end) {
      if (end - begin == 1 || areAllToStay(begin, end)) return;
      ++group;
      for (; begin != end; ++begin, ++kept) {
        *kept = *begin;
        kept->group = group;
      }
    });
    candidates.erase(kept, candidates.end());
  }

  /// The candidates of equal content. Each look is for those that are still alike after the last.
  std::vector<Candidates> readEqual(FileReading& reading, Candidates candidates) {
    const auto look = [&](Look next, Candidates& files) {
      reading.read(next, files);
      leaveOut(reading.takeLosses());
    };
    look(Look::head, candidates);
    keepAgreeing(candidates);
    Candidates rest =
        takeOut(candidates, [&](const auto& file) { return sizeOf(file) > headLength; });

    Candidates large =
        takeOut(rest, [&](const auto& file) { return sizeOf(file) >= worthSamples; });
    look(Look::samples, large);
    keepAgreeing(large);
    look(Look::rest, large);
    keepAgreeing(large);

    Candidates known =
        takeOut(rest, [&](const auto& file) { return reading.restDigest(file.file).has_value(); });
    for (Candidate& file : known) file.key = *reading.restDigest(file.file);
    look(Look::rest, rest);
    rest.insert(rest.end(), known.begin(), known.end());
    keepAgreeing(rest);
    std::vector<Candidates> equal(3);  // A list of them would copy them.
    equal[0].swap(candidates);
    equal[1].swap(large);
    equal[2].swap(rest);
    return equal;
  }

  void leaveOut(const FileReading::Losses& losses) {
    std::vector<LostPath> paths;
    for (const auto& [file, loss] : losses) paths.push_back({tree_->pathOf(file), loss});
    std::sort(paths.begin(), paths.end(),
              [](const LostPath& a, const LostPath& b) { return a.path < b.path; });
    for (const LostPath& lost : paths) leaveOut(lost.path, lost.loss);
  }

  /// The result from groups that are numbered from 1 in each part.
  ScanResult resultFrom(std::vector<Candidates> parts, const std::vector<Footprint>& footprints) {
    std::vector<std::uint32_t> contents;
    ScanResult result = groupFiles(std::move(parts), contents);
    setContentsOfLinks(contents, static_cast<std::uint32_t>(result.groups.size()));
    std::erase_if(links_,
                  [&](const FileLink& link) { return contents[link.file] > result.groups.size(); });
    result.links = std::move(links_);
    result.isPartial = control_.isCancelled;
    computeWaste(result, footprints,
                 findSharedSpace(*tree_, result.files, ports_.fileSystem, ports_.turns, control_));
    findFolderGroups(result, contents);
    std::stable_sort(result.groups.begin(), result.groups.end(),
                     [](const DuplicateGroup& a, const DuplicateGroup& b) {
                       return a.wastedBytes > b.wastedBytes;
                     });
    return result;
  }

  /// The groups by their first path. Gives the content of each a number, from 1 on. A million
  /// candidates take the most memory of all, so that little is made beside them.
  ScanResult groupFiles(std::vector<Candidates> parts, std::vector<std::uint32_t>& contents) {
    std::size_t fileCount = 0, groupCount = 0;
    for (const Candidates& part : parts) {
      fileCount += part.size();
      if (!part.empty()) groupCount += part.back().group;
    }
    // Of the same file each.
    std::vector<FileNumber> files;
    std::vector<std::uint32_t> groupOf;
    std::vector<std::int64_t> modifiedAt;
    files.reserve(fileCount);
    groupOf.reserve(fileCount);
    modifiedAt.reserve(fileCount);
    for (std::uint32_t first = 0; Candidates & part : parts) {
      for (const Candidate& candidate : part) {
        files.push_back(candidate.file);
        groupOf.push_back(first + candidate.group - 1);
        modifiedAt.push_back(candidate.modifiedAt);
      }
      if (!part.empty()) first += part.back().group;
      Candidates().swap(part);
    }
    contents.resize(tree_->endOfNumbers());
    std::vector<DuplicateGroup> groups(groupCount);
    for (std::uint32_t i = 0; i < files.size(); ++i) {
      contents[files[i]] = i;
      DuplicateGroup& group = groups[groupOf[i]];
      group.size = tree_->file(files[i]).size;
      ++group.count;
    }
    for (std::uint32_t end = 0; DuplicateGroup & group : groups) {
      group.begin = end;
      end += std::exchange(group.count, 0);
    }
    sortByPath(*tree_, files);
    ScanResult result{.totals = totals_,
                      .files = std::vector<FileNumber>(fileCount),
                      .modifiedAt = std::vector<std::int64_t>(fileCount),
                      .tree = tree_};
    std::vector<std::uint32_t> byFirstPath;
    for (const FileNumber file : files) {
      const std::uint32_t place = std::exchange(contents[file], groupOf[contents[file]] + 1);
      DuplicateGroup& group = groups[groupOf[place]];
      if (group.count == 0) byFirstPath.push_back(groupOf[place]);
      const std::uint32_t index = group.begin + group.count++;
      result.files[index] = file;
      result.modifiedAt[index] = modifiedAt[place];
    }
    result.groups.reserve(groupCount);
    for (const std::uint32_t group : byFirstPath) result.groups.push_back(groups[group]);
    return result;
  }

  /// Gives a file's further names the number of its content. Where it has no equal, its names have,
  /// for they are of one content.
  void setContentsOfLinks(std::vector<std::uint32_t>& contents, std::uint32_t last) const {
    for (const FileLink& link : links_) {
      if (contents[link.file] == 0) contents[link.file] = ++last;
      contents[link.name] = contents[link.file];
    }
  }

  DuplicateFinder::Ports ports_;
  ScanControl& control_;
  std::shared_ptr<const FileTree> tree_;
  bool hasReferences_ = false;
  ScanTotals totals_;
  std::vector<FileLink> links_;  ///< Of all files; sorted as in the result.
};

}  // namespace

ScanResult DuplicateFinder::find(const ScanRequest& request, ScanControl& control) {
  return Scan(ports_, control).run(request);
}

}  // namespace Orvane
