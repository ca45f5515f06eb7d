// SPDX-License-Identifier: MIT
#include <Scan/FileReading.h>

#include <algorithm>
#include <atomic>
#include <map>
#include <memory>
#include <span>

#include <Scan/DiskTurns.h>
#include <Scan/ScanObserver.h>
#include <Scan/TaskGroup.h>

namespace Orvane {
namespace {

/// Files from this size on are read one after the other on an ordered disk, as its head would go
/// back and forth between two. Less is read at once where the disk must work.
constexpr std::uint64_t largeLength = std::uint64_t{1} << 20;

/// A turn that was over after fewer files and bytes than these was spent waiting for the disk.
constexpr unsigned warmFiles = 8;
constexpr std::uint64_t warmBytes = std::uint64_t{1} << 20;

/// After this many files of a volume without a known place, the others are not asked for theirs.
constexpr unsigned maxUnplaced = 8;

Loss diskIsGone() {
  return {Loss::Kind::unreadable, std::make_error_code(std::errc::no_such_device)};
}

}  // namespace

/// One look at the files of one disk. Its stages follow one another as the last task of each ends.
/// Invariant: the files that have been drawn stand before those that have not.
class FileReading::DiskPass final {
 public:
  DiskPass(FileReading& owner, TaskGroup& group, Look look, const ScanDisk& disk,
           std::span<Candidate> files)
      : owner_(owner), group_(group), look_(look), disk_(disk), files_(files) {}

  void start() {
    if (!disk_.isReadable) {
      for (Candidate& file : files_) lose(file, diskIsGone(), lengthOf(file));
    } else if (disk_.isOrdered && owner_.coldDisks_.contains(&disk_)) {
      place(0);
    } else {
      read(0, disk_.isOrdered ? Stage::byInode : Stage::asTheyCome);
    }
  }

  [[nodiscard]] bool isCold() const { return stage_ == Stage::byPlace; }

 private:
  enum class Stage { asTheyCome, byInode, placing, byPlace };
  class PlacingTask;
  class ReadingTask;

  /// Finds the places of the files from this one on.
  void place(std::size_t begin) {
    stage_ = Stage::placing;
    begin_ = begin;
    running_ = 1;
    startPlacing();
  }

  /// Reads the files from this one on. Where the disk admits it, the next small file is asked for
  /// while one is read. That costs a head no way, and the disk may have none, whatever it says.
  void read(std::size_t begin, Stage stage) {
    stage_ = stage;
    begin_ = begin;
    const auto rest = files_.subspan(begin);
    nextSmall_ = begin;
    largeBegin_ = files_.size();
    if (look_ == Look::rest && disk_.isOrdered && disk_.places > 1) {
      const std::uint64_t max = stage == Stage::byPlace ? ContentReader::blockLength : largeLength;
      const auto large = std::stable_partition(
          rest.begin(), rest.end(), [&](const Candidate& file) { return sizeOf(file) < max; });
      largeBegin_ = begin + static_cast<std::size_t>(large - rest.begin());
    }
    nextLarge_ = largeBegin_;
    isLargeTaken_ = false;
    isInterrupted_ = false;
    running_ = static_cast<unsigned>(std::min<std::size_t>(disk_.places, rest.size()));
    startReading(running_);
  }

  void startPlacing();
  void startReading(unsigned count);

  /// Called by each task as its last deed.
  void didEnd() {
    if (--running_ > 0 || group_.shouldStop()) return;
    if (stage_ == Stage::placing) {
      const auto rest = files_.subspan(begin_);
      std::sort(rest.begin(), rest.end(),
                [](const Candidate& a, const Candidate& b) { return a.key < b.key; });
      read(begin_, Stage::byPlace);
    } else if (isInterrupted_) {
      const std::size_t drawn = std::min<std::size_t>(nextSmall_, largeBegin_);
      place(drawn < largeBegin_ ? drawn : std::min<std::size_t>(nextLarge_, files_.size()));
    }
  }

  /// The next file for a task, which keeps the right to read large ones.
  Candidate* draw(bool& mayReadLarge) {
    if (isInterrupted_.load(std::memory_order_relaxed)) return nullptr;
    if (nextSmall_.load(std::memory_order_relaxed) < largeBegin_) {
      const std::size_t index = nextSmall_.fetch_add(1, std::memory_order_relaxed);
      if (index < largeBegin_) return &files_[index];
    }
    if (nextLarge_.load(std::memory_order_relaxed) >= files_.size()) return nullptr;
    if (!mayReadLarge && isLargeTaken_.exchange(true)) return nullptr;
    mayReadLarge = true;
    const std::size_t index = nextLarge_.fetch_add(1, std::memory_order_relaxed);
    return index < files_.size() ? &files_[index] : nullptr;
  }

  [[nodiscard]] std::uint64_t sizeOf(const Candidate& file) const {
    return owner_.ports_.tree.file(file.file).size;
  }

  /// How much of the file this look reads at this stage.
  [[nodiscard]] Look lookAt(const Candidate& file) const {
    const bool isWhole = look_ == Look::head && stage_ == Stage::byPlace &&
                         sizeOf(file) > headLength && sizeOf(file) <= ContentReader::blockLength;
    return isWhole ? Look::headAndRest : look_;
  }

  /// How much of the file each look reads that has not found it to be worth more.
  [[nodiscard]] std::uint64_t lengthOf(const Candidate& file) const {
    return ContentReader::lengthOf(look_, sizeOf(file));
  }

  /// Some bytes will not be read that were to be.
  void lose(Candidate& file, const Loss& loss, std::uint64_t unreadBytes) {
    owner_.control_.bytesToRead.fetch_sub(unreadBytes, std::memory_order_relaxed);
    const std::lock_guard lock(owner_.mutex_);
    owner_.losses_.emplace_back(std::exchange(file.file, Candidate::lost), loss);
  }

  FileReading& owner_;
  TaskGroup& group_;
  const Look look_;
  const ScanDisk& disk_;
  const std::span<Candidate> files_;

  // What a stage begins with changes while no task runs.
  Stage stage_ = Stage::asTheyCome;
  std::size_t begin_ = 0;
  std::size_t largeBegin_ = 0;
  std::atomic<std::size_t> nextSmall_ = 0;
  std::atomic<std::size_t> nextLarge_ = 0;
  std::atomic<bool> isLargeTaken_ = false;
  std::atomic<bool> isInterrupted_ = false;  ///< The disk turned out to be cold.
  std::atomic<unsigned> running_ = 0;
};

/// Asks where the files lie, and reads none of them.
class FileReading::DiskPass::PlacingTask final : public TaskGroup::Task {
 public:
  explicit PlacingTask(DiskPass& pass)
      : pass_(pass),
        reader_(pass.owner_.ports_.tree, pass.owner_.ports_.fileSystem, pass.owner_.secret_),
        next_(pass.begin_) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    while (next_ < pass_.files_.size() && !pass_.group_.shouldStop()) {
      place(pass_.files_[next_++]);
      if (turn.isOver()) return 0;
    }
    pass_.didEnd();
    return std::nullopt;
  }

  void refuse() override { pass_.didEnd(); }

 private:
  void place(Candidate& file) {
    file.key = pass_.owner_.ports_.tree.locationOf(file.file);
    unsigned& unplaced = unplaced_[file.key[0]];
    if (unplaced == maxUnplaced) return;
    if (const auto place = reader_.placeOf(file.file)) {
      file.key[1] = *place;
      unplaced = 0;
    } else {
      ++unplaced;
    }
  }

  DiskPass& pass_;
  ContentReader reader_;
  std::size_t next_;
  std::map<std::uint64_t, unsigned> unplaced_;  ///< In a row, by volume.
};

class FileReading::DiskPass::ReadingTask final : public TaskGroup::Task {
 public:
  explicit ReadingTask(DiskPass& pass)
      : pass_(pass),
        reader_(pass.owner_.ports_.tree, pass.owner_.ports_.fileSystem, pass.owner_.secret_) {}

  std::optional<std::uint64_t> run(DiskTurn& turn) override {
    unsigned files = 0;
    std::uint64_t bytes = 0;
    bool goesOn = true;
    do {
      goesOn = !pass_.group_.shouldStop() && (file_ || begin());
      if (!goesOn) break;
      const bool isFinished = reader_.step();
      bytes += reader_.stepLength();
      unreadBytes_ -= std::min(reader_.stepLength(), unreadBytes_);
      turn.didRead(reader_.stepLength());
      if (isFinished) {
        settle();
        ++files;
      }
    } while (!turn.isOver());

    ScanControl& control = pass_.owner_.control_;
    control.filesRead.fetch_add(files, std::memory_order_relaxed);
    control.bytesRead.fetch_add(bytes, std::memory_order_relaxed);
    if (!goesOn) {
      end();
      return std::nullopt;
    }
    if (pass_.stage_ == Stage::byInode && files < warmFiles && bytes < warmBytes)
      pass_.isInterrupted_ = true;
    return place_;
  }

  void refuse() override {
    while (file_ || begin()) {
      pass_.lose(*file_, diskIsGone(), unreadBytes_);
      file_ = nullptr;
    }
    end();
  }

 private:
  bool begin() {
    file_ = pass_.draw(mayReadLarge_);
    if (!file_) return false;
    place_ = file_->key[1];
    look_ = pass_.lookAt(*file_);
    unreadBytes_ = ContentReader::lengthOf(look_, pass_.sizeOf(*file_));
    pass_.owner_.control_.bytesToRead.fetch_add(unreadBytes_ - pass_.lengthOf(*file_),
                                                std::memory_order_relaxed);
    reader_.begin(file_->file, look_);
    return true;
  }

  void settle() {
    Candidate& file = *std::exchange(file_, nullptr);
    if (const auto& loss = reader_.loss()) return pass_.lose(file, *loss, unreadBytes_);
    const FileStatus& status = reader_.status();
    file.modifiedAt = status.modifiedAt;
    const bool isRead =
        look_ != Look::samples && (look_ != Look::head || status.size <= headLength);
    if (isRead && (status.links > 1 || status.allocated < status.size))
      footprints_.push_back({file.file, status.links, std::min(status.allocated, status.size)});
    if (look_ == pass_.look_) {
      file.key = reader_.digest();
    } else {
      file.key = reader_.headDigest();
      rests_.emplace_back(file.file, reader_.digest());
    }
  }

  void end() {
    {
      const std::lock_guard lock(pass_.owner_.mutex_);
      Digests& all = pass_.owner_.restDigests_;
      all.insert(all.end(), rests_.begin(), rests_.end());
      auto& footprints = pass_.owner_.footprints_;
      footprints.insert(footprints.end(), footprints_.begin(), footprints_.end());
    }
    pass_.didEnd();
  }

  DiskPass& pass_;
  ContentReader reader_;
  Candidate* file_ = nullptr;  ///< The one that is being read.
  Look look_ = Look::head;
  std::uint64_t place_ = 0;
  std::uint64_t unreadBytes_ = 0;  ///< Of the file.
  bool mayReadLarge_ = false;
  Digests rests_;
  std::vector<Footprint> footprints_;
};

void FileReading::DiskPass::startPlacing() {
  group_.start(disk_, std::make_unique<PlacingTask>(*this));
}

void FileReading::DiskPass::startReading(unsigned count) {
  for (; count > 0; --count) group_.start(disk_, std::make_unique<ReadingTask>(*this));
}

FileReading::~FileReading() = default;

void FileReading::read(Look look, std::vector<Candidate>& candidates) {
  if (control_.isCancelled) {
    unreachedFiles_ += candidates.size();
    return candidates.clear();
  }
  control_.filesToRead.fetch_add(candidates.size(), std::memory_order_relaxed);
  std::uint64_t bytes = 0;
  for (Candidate& candidate : candidates) {
    bytes += ContentReader::lengthOf(look, ports_.tree.file(candidate.file).size);
    candidate.key = ports_.tree.locationOf(candidate.file);
    candidate.modifiedAt = Candidate::unread;
  }
  control_.bytesToRead.fetch_add(bytes, std::memory_order_relaxed);
  const auto liesBefore = [](const Candidate& a, const Candidate& b) { return a.key < b.key; };
  if (!std::is_sorted(candidates.begin(), candidates.end(), liesBefore))
    std::sort(candidates.begin(), candidates.end(), liesBefore);

  TaskGroup group(ports_.turns, control_);
  std::map<const ScanDisk*, std::unique_ptr<DiskPass>> passes;
  for (auto begin = candidates.begin(); begin != candidates.end();) {
    const ScanDisk& disk = ports_.tree.diskOf(begin->file);
    const auto end = std::find_if(begin, candidates.end(), [&](const Candidate& candidate) {
      return &ports_.tree.diskOf(candidate.file) != &disk;
    });
    passes[&disk] = std::make_unique<DiskPass>(*this, group, look, disk, std::span(begin, end));
    begin = end;
  }
  for (const auto& [disk, pass] : passes) pass->start();
  group.wait();
  for (const auto& [disk, pass] : passes)
    if (pass->isCold()) coldDisks_.insert(disk);
  std::erase_if(candidates, [](const Candidate& file) { return file.file == Candidate::lost; });
  unreachedFiles_ += std::erase_if(
      candidates, [](const Candidate& file) { return file.modifiedAt == Candidate::unread; });
  std::sort(restDigests_.begin(), restDigests_.end());
}

std::vector<Footprint> FileReading::takeFootprints() {
  sortByFile(footprints_);
  return std::exchange(footprints_, {});
}

std::optional<Digest> FileReading::restDigest(FileNumber file) const {
  const auto found =
      std::lower_bound(restDigests_.begin(), restDigests_.end(), file,
                       [](const auto& digest, FileNumber number) { return digest.first < number; });
  if (found == restDigests_.end() || found->first != file) return std::nullopt;
  return found->second;
}

}  // namespace Orvane
