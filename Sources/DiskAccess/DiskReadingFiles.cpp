// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingFiles.h>

#include <algorithm>
#include <chrono>
#include <limits>
#include <numeric>
#include <system_error>
#include <utility>

#include <Varnel/Basalt/SecurityScopeBookkeeping.h>
#include <Varnel/DiskAccess/DiskReadingCore.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/WaitingDeadline.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel {

/// One of the tasks that read the files of a volume. It has a file in hand from the moment when it
/// takes one to the moment when that has ended, perhaps in a later turn.
class DiskReadingFiles::Reader final : public DiskReadingTask {
 public:
  Reader(std::shared_ptr<DiskReadingFiles> files, std::shared_ptr<Volume> volume)
      : files_(std::move(files)), volume_(std::move(volume)) {}

  DiskReadingNext run(DiskReadingTurn& turn) override {
    while (inHand_ || (inHand_ = files_->take(*volume_))) {
      const DiskReadingFile& file = files_->files_[*inHand_];
      // The turn has begun with other files, and this one would make it too long.
      if (turn.byteCount() > 0 &&
          file.size.value_or(0) >
              DiskReadingTurn::maxBytes - std::min(turn.byteCount(), DiskReadingTurn::maxBytes))
        return DiskReadingNext::again(file.place);
      const auto next = files_->readOne(file, turn);
      if (next && next->isAgain())
        return DiskReadingNext::again(next->place() ? next->place() : file.place);
      endInHand(next ? DiskReadingResult::read : DiskReadingResult::notReadable);
      if (turn.isOver()) break;
    }
    if (files_->isImpatient())
      files_->callBack(files_->endWaiting(volume_->files), DiskReadingResult::timedOut);
    const std::lock_guard lock(files_->mutex_);
    const DiskReadingFile* following = files_->following(*volume_);
    return following ? DiskReadingNext::again(following->place) : DiskReadingNext::done();
  }

  void didEnd(DiskReadingResult result) override {
    if (result == DiskReadingResult::read) return;
    if (inHand_) endInHand(result);
    for (const Index file : files_->endWaiting(volume_->files))
      files_->didEnd_(files_->files_[file], result);
  }

 private:
  void endInHand(DiskReadingResult result) { files_->end(*std::exchange(inHand_, {}), result); }

  const std::shared_ptr<DiskReadingFiles> files_;
  const std::shared_ptr<Volume> volume_;
  std::optional<Index> inHand_;
};

DiskReadingFiles::DiskReadingFiles(std::shared_ptr<DiskReadingCore> core,
                                   std::vector<DiskReadingFile> files, DiskReadingOptions options,
                                   DiskReadingQueue::Read read, DiskReadingQueue::DidEnd didEnd)
    : core_(std::move(core)),
      files_(std::move(files)),
      options_(std::move(options)),
      read_(std::move(read)),
      didEnd_(std::move(didEnd)),
      states_(files_.size(), State::waiting) {}

DiskReadingFiles::~DiskReadingFiles() {
  core_->watch().cancel(timer_);
}

// Starting.

void DiskReadingFiles::start() {
  const auto lookUp = [self = shared_from_this()] { self->lookUp(); };
  const bool areVolumesKnown = std::all_of(
      files_.begin(), files_.end(), [](const auto& file) { return file.volumeURL.has_value(); });
  if (areVolumesKnown)
    core_->plan(lookUp);
  else
    core_->lookUp(lookUp);
  const auto weakly = [&](void (DiskReadingFiles::*act)()) {
    return [act, weak = weak_from_this()] {
      if (const auto self = weak.lock()) (self.get()->*act)();
    };
  };
  const auto maxWaiting = maxWaitingTime(options_.accessWaitingTimeout);
  if (maxWaiting && !isImpatient())
    timer_ = core_->watch().at(DiskReadingWatch::Time::clock::now() + *maxWaiting,
                               weakly(&DiskReadingFiles::timeOut));
  stopper_.emplace(options_.stop, weakly(&DiskReadingFiles::stop));
  closer_.emplace(core_->closing(), weakly(&DiskReadingFiles::stop));
}

void DiskReadingFiles::lookUp() {
  const std::uint64_t unmountCount = core_->unmountCount();
  readFoundLater(unmountCount);
  for (Index file = 0; file < files_.size(); ++file) {
    if (readers_.stop_requested()) return;
    const auto url = volumeOf(files_[file]);
    if (url)
      addFound(file, *url);
    else
      callBack(endWaiting({file}), DiskReadingResult::unknownVolume);
  }
  {
    const std::lock_guard lock(mutex_);
    isLookedUp_ = true;
  }
  readFound(unmountCount);
}

void DiskReadingFiles::addFound(Index file, const Platform::URL& volumeURL) {
  const std::lock_guard lock(mutex_);
  const auto [place, isNew] = foundVolumes_.try_emplace(volumeURL, found_.size());
  if (isNew) found_.push_back(std::make_shared<Volume>(Volume{.url = volumeURL}));
  found_[place->second]->files.push_back(file);
}

// A look-up on a dead share keeps the other files waiting no longer than this.
void DiskReadingFiles::readFoundLater(std::uint64_t unmountCount) {
  constexpr std::chrono::milliseconds patience{100};
  (void)core_->watch().at(
      DiskReadingWatch::Time::clock::now() + patience, [weak = weak_from_this(), unmountCount] {
        const auto self = weak.lock();
        if (!self || self->readers_.stop_requested()) return;
        {
          const std::lock_guard lock(self->mutex_);
          if (self->isLookedUp_) return;
        }
        self->readFoundLater(unmountCount);
        try {
          self->core_->plan([self, unmountCount] { self->readFound(unmountCount); });
        } catch (const std::system_error&) {
          return;  // The next time, perhaps.
        }
      });
}

void DiskReadingFiles::readFound(std::uint64_t unmountCount) {
  std::vector<std::shared_ptr<Volume>> found;
  {
    const std::lock_guard lock(mutex_);
    found.swap(found_);
    foundVolumes_.clear();
  }
  for (const auto& volume : found) readVolume(volume, unmountCount);
}

std::optional<Platform::URL> DiskReadingFiles::volumeOf(const DiskReadingFile& file) const {
  if (file.volumeURL) return file.volumeURL;
  const auto found = core_->disks().volumes().volumeURL(file.url);
  return found ? *found : std::nullopt;
}

void DiskReadingFiles::readVolume(const std::shared_ptr<Volume>& volume,
                                  std::uint64_t unmountCount) {
  const auto disk = core_->disks().settledRecordOfVolume(volume->url)->diskInfo();
  if (disk->kind() != OVDiskKindSolidState)
    std::stable_sort(volume->files.begin(), volume->files.end(), [this](Index one, Index other) {
      constexpr auto end = std::numeric_limits<std::uint64_t>::max();
      return files_[one].place.value_or(end) < files_[other].place.value_or(end);
    });
  constexpr std::int64_t maxReaders = 64;
  const auto fileCount = static_cast<std::int64_t>(volume->files.size());
  // What does not wait at all is read in the first turn, or not.
  const std::int64_t readers =
      isImpatient()
          ? 1
          : std::min({std::max<std::int64_t>(disk->maxTreads(), 1), fileCount, maxReaders});
  DiskReadingFile first = files_[volume->files.front()];
  first.volumeURL = volume->url;
  DiskReadingOptions options = options_;
  options.stop = readers_.get_token();
  if (!isImpatient()) options.accessWaitingTimeout.reset();
  for (std::int64_t reader = 0; reader < readers; ++reader)
    core_->submit(std::make_shared<Reader>(shared_from_this(), volume), first, options,
                  unmountCount);
}

bool DiskReadingFiles::isImpatient() const {
  return options_.accessWaitingTimeout && *options_.accessWaitingTimeout <= 0;
}

// Files that nobody has taken.

void DiskReadingFiles::stop() {
  callBack(endWaiting(), DiskReadingResult::stopped);
  readers_.request_stop();
}

void DiskReadingFiles::timeOut() {
  callBack(endWaiting(), DiskReadingResult::timedOut);
  std::unique_lock lock(mutex_);
  const bool areReadersIdle = begun_ == 0;
  lock.unlock();
  if (areReadersIdle) readers_.request_stop();
}

std::vector<DiskReadingFiles::Index> DiskReadingFiles::endWaiting() {
  std::vector<Index> all(files_.size());
  std::iota(all.begin(), all.end(), Index{0});
  return endWaiting(all);
}

std::vector<DiskReadingFiles::Index> DiskReadingFiles::endWaiting(const std::vector<Index>& files) {
  std::vector<Index> ended;
  const std::lock_guard lock(mutex_);
  for (const Index file : files)
    if (states_[file] == State::waiting) {
      states_[file] = State::ended;
      ended.push_back(file);
    }
  return ended;
}

void DiskReadingFiles::callBack(std::vector<Index> files, DiskReadingResult result) {
  if (files.empty()) return;
  core_->callBack(options_.executor, [self = shared_from_this(), files = std::move(files), result] {
    for (const Index file : files) self->didEnd_(self->files_[file], result);
  });
}

// Reading.

std::optional<DiskReadingFiles::Index> DiskReadingFiles::take(Volume& volume) {
  const std::lock_guard lock(mutex_);
  if (!following(volume)) return std::nullopt;
  const Index file = volume.files[volume.next++];
  states_[file] = State::begun;
  ++begun_;
  return file;
}

// Under the lock.
const DiskReadingFile* DiskReadingFiles::following(Volume& volume) {
  while (volume.next < volume.files.size()) {
    const Index file = volume.files[volume.next];
    if (states_[file] == State::waiting) return &files_[file];
    ++volume.next;
  }
  return nullptr;
}

// Absent when the file's security scope cannot be opened.
std::optional<DiskReadingNext> DiskReadingFiles::readOne(const DiskReadingFile& file,
                                                         DiskReadingTurn& turn) const {
  auto& scopes = core_->disks().scopes();
  const bool opensScope = file.enableSecureScopedAccess;
  if (opensScope && !scopes.beginAccessingSecurityScopedResource(file.url, options_.propose))
    return std::nullopt;
  const std::uint64_t before = turn.byteCount();
  const DiskReadingNext next = read_(file, turn);
  if (turn.byteCount() == before) turn.didRead(file.size.value_or(0));
  if (opensScope) scopes.endAccessingSecurityScopedResource(file.url, options_.propose);
  return next;
}

void DiskReadingFiles::end(Index file, DiskReadingResult result) {
  didEnd_(files_[file], result);
  const std::lock_guard lock(mutex_);
  states_[file] = State::ended;
  --begun_;
}

}  // namespace Varnel
