// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <unordered_map>
#include <vector>

#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/DiskAccess/DiskReadingWatch.h>

namespace Varnel {

class DiskReadingCore;

/// The files of one call of `DiskReadingQueue::read`. Each volume has as many tasks as its disk has
/// places. They share its files, and hold this object.
class DiskReadingFiles final : public std::enable_shared_from_this<DiskReadingFiles> {
 public:
  DiskReadingFiles(std::shared_ptr<DiskReadingCore> core, std::vector<DiskReadingFile> files,
                   DiskReadingOptions options, DiskReadingQueue::Read read,
                   DiskReadingQueue::DidEnd didEnd);
  ~DiskReadingFiles();

  /// Once. Throws `std::system_error` when there is no thread; then nobody is called back.
  void start();

 private:
  class Reader;
  enum class State : std::uint8_t { waiting, begun, ended };
  using Index = std::size_t;

  /// Files of one volume, in the order in which they are to be read.
  struct Volume {
    Platform::URL url;
    std::vector<Index> files{};
    std::size_t next = 0;
  };

  void lookUp();
  void addFound(Index file, const Platform::URL& volumeURL);
  void readFoundLater(std::uint64_t unmountCount);
  void readFound(std::uint64_t unmountCount);
  [[nodiscard]] std::optional<Platform::URL> volumeOf(const DiskReadingFile& file) const;
  void readVolume(const std::shared_ptr<Volume>& volume, std::uint64_t unmountCount);
  [[nodiscard]] bool isImpatient() const;

  // Any thread.
  void stop();
  void timeOut();
  [[nodiscard]] std::vector<Index> endWaiting();
  [[nodiscard]] std::vector<Index> endWaiting(const std::vector<Index>& files);
  void callBack(std::vector<Index> files, DiskReadingResult result);

  // Readers.
  [[nodiscard]] std::optional<Index> take(Volume& volume);
  [[nodiscard]] const DiskReadingFile* following(Volume& volume);
  [[nodiscard]] std::optional<DiskReadingNext> readOne(const DiskReadingFile& file,
                                                       DiskReadingTurn& turn) const;
  void end(Index file, DiskReadingResult result);

  const std::shared_ptr<DiskReadingCore> core_;
  const std::vector<DiskReadingFile> files_;
  const DiskReadingOptions options_;
  const DiskReadingQueue::Read read_;
  const DiskReadingQueue::DidEnd didEnd_;
  std::stop_source readers_;  ///< Stops them.

  std::mutex mutex_;  ///< Owns what follows, and what is next of each volume.
  std::vector<State> states_;
  std::size_t begun_ = 0;
  std::vector<std::shared_ptr<Volume>> found_;                   ///< Those that nobody reads yet.
  std::unordered_map<Platform::URL, std::size_t> foundVolumes_;  ///< Where they stand there.
  bool isLookedUp_ = false;

  // The rest is set by `start` alone.
  DiskReadingWatch::Timer timer_{};
  using Stopper = std::stop_callback<std::function<void()>>;
  std::optional<Stopper> stopper_;
  std::optional<Stopper> closer_;
};

}  // namespace Varnel
