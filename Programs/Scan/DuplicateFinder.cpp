// SPDX-License-Identifier: MIT
#include <Scan/DuplicateFinder.h>

#include <algorithm>
#include <limits>
#include <optional>
#include <tuple>
#include <unordered_map>
#include <utility>

#include <Scan/ContentReader.h>
#include <Scan/FileTree.h>
#include <Scan/ScanObserver.h>
#include <Scan/ThreadTeam.h>

namespace Orvane {
namespace {

/// How much of a file is looked at first. A disk reads this much in one go anyway, and most files
/// are not larger.
constexpr std::uint64_t headLength = 4096;
constexpr std::uint64_t wholeLength = std::numeric_limits<std::uint64_t>::max();

/// A file that may have a duplicate.
struct Candidate {
  const FileRecord* file;
  Digest digest{};
  std::optional<Loss> loss{};
};

using Candidates = std::vector<Candidate>;
/// Files that are equal as far as they have been looked at, in the order of their paths.
using Group = std::vector<const FileRecord*>;

using Losses = std::vector<std::pair<std::string, Loss>>;

bool liesBefore(const FileRecord* first, const FileRecord* second) {
  return first->status.identity < second->status.identity;
}

/// One scan. Its data belongs to the thread that runs it, but for the item that a worker has drawn.
class Scan final {
 public:
  Scan(DuplicateFinder::Ports ports, unsigned threads, ScanControl& control)
      : ports_(ports), threads_(threads), control_(control) {}

  ScanResult run(const std::vector<std::string>& folders) {
    tree_ = walkFolders(folders, ports_.fileSystem, threads_, control_);
    if (!tree_.lostRoots.empty()) return {.lostFolders = std::move(tree_.lostRoots)};
    reportWalk();
    Candidates candidates = filesOfSharedSize(distinctFiles());
    takeDigests(candidates, headLength);
    std::vector<Group> likely;
    Candidates undecided;
    for (Group& group : groupsOfEqualDigest(std::move(candidates))) {
      // Two files are best compared at once: a digest of each would read just as much.
      if (group.size() == 2 || group.front()->status.size <= headLength) {
        likely.push_back(std::move(group));
      } else {
        for (const FileRecord* file : group) undecided.push_back({file});
      }
    }
    std::sort(undecided.begin(), undecided.end(),
              [](const Candidate& a, const Candidate& b) { return liesBefore(a.file, b.file); });
    takeDigests(undecided, wholeLength);
    for (Group& group : groupsOfEqualDigest(std::move(undecided)))
      likely.push_back(std::move(group));
    while (!likely.empty() && !control_.isCancelled) likely = confirm(std::move(likely));
    return finish();
  }

 private:
  void reportWalk() {
    totals_.folders = tree_.folders.size();
    totals_.unreadableFolders = tree_.unreadableFolders.size();
    totals_.files = tree_.files.size() + tree_.unreadableFiles.size();
    for (const LostPath& lost : tree_.unreadableFolders)
      ports_.observer.folderLeftOut(lost.path, lost.loss);
    for (const LostPath& lost : tree_.unreadableFiles) leaveOut(lost.path, lost.loss);
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

  void leaveOut(Losses losses) {
    std::sort(losses.begin(), losses.end(),
              [](const auto& a, const auto& b) { return a.first < b.first; });
    for (const auto& [path, loss] : losses) leaveOut(path, loss);
  }

  /// The files that have content, each under its first path, in the order in which they likely lie
  /// on their disks.
  Group distinctFiles() {
    Group files;
    files.reserve(tree_.files.size());
    for (const FileRecord& file : tree_.files) {
      if (file.status.size == 0) {
        ++totals_.emptyFiles;
      } else {
        files.push_back(&file);
      }
    }
    std::sort(files.begin(), files.end(), [](const FileRecord* a, const FileRecord* b) {
      if (a->status.identity != b->status.identity) return liesBefore(a, b);
      return pathPrecedes(*a, *b);
    });
    const auto end =
        std::unique(files.begin(), files.end(), [](const FileRecord* a, const FileRecord* b) {
          return a->status.identity == b->status.identity;
        });
    totals_.hardLinks = static_cast<std::uint64_t>(files.end() - end);
    files.erase(end, files.end());
    for (const FileRecord* file : files) totals_.bytes += file->status.size;
    return files;
  }

  static Candidates filesOfSharedSize(const Group& files) {
    std::unordered_map<std::uint64_t, std::uint32_t> filesOfSize;
    filesOfSize.reserve(files.size());
    for (const FileRecord* file : files) ++filesOfSize[file->status.size];
    Candidates candidates;
    for (const FileRecord* file : files)
      if (filesOfSize[file->status.size] > 1) candidates.push_back({file});
    return candidates;
  }

  /// Digests each candidate's first `length` bytes and leaves out those that are lost. The
  /// candidates are sorted by disk.
  void takeDigests(Candidates& candidates, std::uint64_t length) {
    std::vector<std::size_t> ends;
    for (std::size_t i = 1; i <= candidates.size(); ++i) {
      if (i == candidates.size() || candidates[i].file->status.identity.device !=
                                        candidates[i - 1].file->status.identity.device)
        ends.push_back(i);
    }
    readAll(ends, [&](ContentReader& reader, std::size_t index) {
      Candidate& candidate = candidates[index];
      auto digest = reader.digest(*candidate.file, length);
      if (digest) {
        candidate.digest = *digest;
      } else {
        candidate.loss = digest.error();
      }
    });
    Losses losses;
    for (const Candidate& candidate : candidates)
      if (candidate.loss) losses.emplace_back(candidate.file->path(), *candidate.loss);
    leaveOut(std::move(losses));
    std::erase_if(candidates, [](const Candidate& candidate) { return candidate.loss; });
  }

  /// The groups of candidates that agree in size and digest.
  static std::vector<Group> groupsOfEqualDigest(Candidates candidates) {
    const auto key = [](const Candidate& candidate) {
      return std::tie(candidate.file->status.size, candidate.digest);
    };
    std::sort(candidates.begin(), candidates.end(), [&](const Candidate& a, const Candidate& b) {
      if (key(a) != key(b)) return key(a) < key(b);
      return pathPrecedes(*a.file, *b.file);
    });
    std::vector<Group> groups;
    for (auto begin = candidates.begin(); begin != candidates.end();) {
      const auto end = std::find_if(begin, candidates.end(), [&](const Candidate& candidate) {
        return key(candidate) != key(*begin);
      });
      if (end - begin > 1) {
        Group& group = groups.emplace_back();
        for (auto member = begin; member != end; ++member) group.push_back(member->file);
      }
      begin = end;
    }
    return groups;
  }

  /// Compares the files of each group with its first. Those that are equal to it go to the result;
  /// returned are the groups of what is left, each smaller than before.
  std::vector<Group> confirm(std::vector<Group> groups) {
    struct Pair {
      const FileRecord* first;
      const FileRecord* second;
      Comparison comparison{};
    };
    std::vector<Pair> pairs;
    for (const Group& group : groups)
      for (std::size_t i = 1; i < group.size(); ++i) pairs.push_back({group.front(), group[i]});
    readAll({pairs.size()}, [&](ContentReader& reader, std::size_t index) {
      pairs[index].comparison = reader.compare(*pairs[index].first, *pairs[index].second);
    });

    std::vector<Group> rest;
    Losses losses;
    auto pair = pairs.begin();
    for (const Group& group : groups) {
      Group equal{group.front()};
      Group different;
      std::optional<Loss> loss;
      for (std::size_t i = 1; i < group.size(); ++i, ++pair) {
        const Comparison& comparison = pair->comparison;
        if (comparison.firstLoss) loss = comparison.firstLoss;
        if (comparison.secondLoss) {
          losses.emplace_back(group[i]->path(), *comparison.secondLoss);
        } else {
          (comparison.isEqual ? equal : different).push_back(group[i]);
        }
      }
      if (loss) {
        // Comparisons with a first file that was lost do not count.
        losses.emplace_back(group.front()->path(), *loss);
        different.insert(different.end(), equal.begin() + 1, equal.end());
        std::sort(different.begin(), different.end(),
                  [](const FileRecord* a, const FileRecord* b) { return pathPrecedes(*a, *b); });
      } else if (equal.size() > 1) {
        add(equal);
      }
      if (different.size() > 1) rest.push_back(std::move(different));
    }
    leaveOut(std::move(losses));
    return rest;
  }

  void add(const Group& equal) {
    DuplicateGroup& group = groups_.emplace_back();
    group.size = equal.front()->status.size;
    for (const FileRecord* file : equal) group.paths.push_back(file->path());
  }

  /// Makes the workers run `read` for every index below the end of the last lane.
  template <typename Read>
  void readAll(const std::vector<std::size_t>& laneEnds, const Read& read) {
    if (laneEnds.empty() || laneEnds.back() == 0) return;
    control_.filesToRead.fetch_add(laneEnds.back(), std::memory_order_relaxed);
    WorkLanes lanes(laneEnds);
    runOnThreads(threads_, [&](unsigned worker) {
      ContentReader reader({ports_.fileSystem, ports_.access}, control_);
      for (std::size_t index = 0; !control_.isCancelled && lanes.next(worker, index);) {
        read(reader, index);
        control_.filesRead.fetch_add(1, std::memory_order_relaxed);
      }
    });
  }

  ScanResult finish() {
    std::sort(groups_.begin(), groups_.end(), [](const DuplicateGroup& a, const DuplicateGroup& b) {
      if (a.wastedBytes() != b.wastedBytes()) return a.wastedBytes() > b.wastedBytes();
      return a.paths.front() < b.paths.front();
    });
    for (const DuplicateGroup& group : groups_) {
      totals_.duplicateFiles += group.paths.size() - 1;
      totals_.wastedBytes += group.wastedBytes();
    }
    return {.groups = std::move(groups_), .totals = totals_};
  }

  DuplicateFinder::Ports ports_;
  unsigned threads_;
  ScanControl& control_;
  FileTree tree_;
  std::vector<DuplicateGroup> groups_;
  ScanTotals totals_;
};

}  // namespace

DuplicateFinder::DuplicateFinder(Ports ports, unsigned threads)
    : ports_(ports), threads_(std::max(threads, 1u)) {}

ScanResult DuplicateFinder::find(const std::vector<std::string>& folders, ScanControl& control) {
  return Scan(ports_, threads_, control).run(folders);
}

}  // namespace Orvane
