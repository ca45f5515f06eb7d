// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stop_token>
#include <string>
#include <utility>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

/// How a reading ended. After all but `read` and `stopped`, nothing was read, or no more of it than
/// a task read in turns before.
enum class DiskReadingResult {
  read,           ///< To its end, inside a place on the disk.
  unknownVolume,  ///< The volume of the file could not be told.
  notReadable,    ///< The file's security scope could not be opened.
  timedOut,       ///< The disk gave no turn within the time-out.
  stopped,        ///< By the stop token, or because the queue was destroyed.
  vanished,       ///< The volume was unmounted.
};

/// A stay on a disk, as long as others may be made to wait: 4 MiB or 20 ms, whichever is over
/// first. Belongs to the call that it is given to, and to its thread.
class VARNEL_API DiskReadingTurn final {
 public:
  using Clock = std::chrono::steady_clock;
  using Now = std::function<Clock::time_point()>;

  static constexpr std::uint64_t maxBytes = 4u << 20;
  static constexpr std::chrono::milliseconds maxTime{20};

  /// `isEnded` ends the turn early, from any thread. Both outlive the turn.
  DiskReadingTurn(const Now& now, const std::atomic<bool>& isEnded);
  DiskReadingTurn(const DiskReadingTurn&) = delete;
  DiskReadingTurn& operator=(const DiskReadingTurn&) = delete;

  /// Counts bytes that were read. To be called after each read, of about a megabyte at most.
  void didRead(std::uint64_t bytes) { byteCount_ += bytes; }
  [[nodiscard]] std::uint64_t byteCount() const { return byteCount_; }

  /// Whether the reader is to leave the disk now: its share is used up, or the reading was stopped.
  /// A reader asks between two reads, however small. Costs a look at the clock.
  [[nodiscard]] bool isOver() const;

 private:
  const Now& now_;
  const std::atomic<bool>& isEnded_;
  const Clock::time_point end_;
  std::uint64_t byteCount_ = 0;
};

/// What a reader answers at the end of a call: that it is done, or that it wants another turn.
class DiskReadingNext final {
 public:
  [[nodiscard]] static DiskReadingNext done() { return DiskReadingNext(false, {}); }

  /// `place` is where the reading goes on, see `DiskReadingFile::place`.
  [[nodiscard]] static DiskReadingNext again(std::optional<std::uint64_t> place = {}) {
    return DiskReadingNext(true, place);
  }

  [[nodiscard]] bool isAgain() const { return isAgain_; }
  [[nodiscard]] std::optional<std::uint64_t> place() const { return place_; }

 private:
  DiskReadingNext(bool isAgain, std::optional<std::uint64_t> place)
      : isAgain_(isAgain), place_(place) {}

  bool isAgain_;
  std::optional<std::uint64_t> place_;
};

/// Reading of any length on one disk, done in turns. `DiskReadingQueue` calls it.
///
///     class Heads final : public DiskReadingTask {
///       DiskReadingNext run(DiskReadingTurn& turn) override {
///         while (next_ < files_.size()) {
///           turn.didRead(readHead(files_[next_++]));
///           if (turn.isOver()) return DiskReadingNext::again(placeOf(next_));
///         }
///         return DiskReadingNext::done();
///       }
///       void didEnd(DiskReadingResult) override { finished_.count_down(); }
///     };
///
/// Its calls come one after another, each perhaps on another thread. They must not throw. They may
/// use the queue, and even destroy it.
class VARNEL_API DiskReadingTask {
 public:
  virtual ~DiskReadingTask() = default;

  /// Reads until it is done or the turn is over. The calling thread has a place on the disk
  /// meanwhile, so that sessions which it begins there do not wait.
  [[nodiscard]] virtual DiskReadingNext run(DiskReadingTurn& turn) = 0;

  /// Called once, and last. After `run` has answered that it is done, on the same thread and inside
  /// the place; with any other result off the disk, where the options say.
  virtual void didEnd(DiskReadingResult result) = 0;
};

/// A file to be read, or one that stands for all that a task reads.
struct DiskReadingFile {
  Platform::URL url;

  /// The volume that it lies on, if it is known; this saves a look-up. Written as in the inventory,
  /// with a "/" at the end.
  std::optional<Platform::URL> volumeURL{};

  /// Where it lies on the disk: a number that grows with the distance from the disk's beginning,
  /// such as its first physical block, or its inode. Where a seek costs nothing it is ignored.
  std::optional<std::uint64_t> place{};

  /// In bytes. Counts as read when the reader itself counts nothing.
  std::optional<std::uint64_t> size{};

  /// Whether its security scope is open while it is read. Tasks see to theirs themselves.
  bool enableSecureScopedAccess = true;
};

/// How a reading is to be done.
struct DiskReadingOptions {
  /// What for; kept with sessions and security scopes.
  std::string propose{};

  /// The class in which to wait. In the two lowest classes the thread's reading also gives way to
  /// that of other programs, as far as the system knows how, and so does that of threads which a
  /// callback starts.
  Platform::QualityOfService qos = Platform::QualityOfService::utility;

  /// How many seconds a file, or a task, may wait for its first turn. None, not a number or beyond
  /// all dates: for ever; negative: not at all.
  std::optional<Platform::TimeInterval> accessWaitingTimeout{};

  /// Answers what waits, and ends the turn of what runs.
  std::stop_token stop{};

  /// Where everything is called back: reading and results. Null: on threads of the queue's own.
  std::shared_ptr<Basalt::Executor> executor{};
};

}  // namespace Varnel
