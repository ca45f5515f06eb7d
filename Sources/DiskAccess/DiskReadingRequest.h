// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stop_token>
#include <utility>

#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/DiskReadingTask.h>
#include <Varnel/DiskAccess/DiskReadingWatch.h>

namespace Varnel {

/// A task, and how far it has come. The core's lock owns what is not constant.
struct DiskReadingRequest {
  enum class State {
    placing,  ///< Its volume, or the record of that, is being looked up.
    waiting,  ///< In the line of its lane.
    offered,  ///< A worker holds a place for it and waits for its executor.
    putOff,   ///< The executor took too long. It goes back to its lane after the executor begins.
    running,
    ended,  ///< Its result is settled.
  };

  DiskReadingRequest(std::shared_ptr<DiskReadingTask> theTask, DiskReadingFile theFile,
                     DiskReadingOptions theOptions, std::uint64_t theNumber)
      : task(std::move(theTask)),
        file(std::move(theFile)),
        options(std::move(theOptions)),
        urgency(urgencyClassOf(options.qos)),
        number(theNumber),
        volumeURL(file.volumeURL),
        place(file.place) {}

  /// Whether it does not wait at all for its first turn.
  [[nodiscard]] bool isImpatient() const {
    return options.accessWaitingTimeout && *options.accessWaitingTimeout <= 0;
  }

  const std::shared_ptr<DiskReadingTask> task;
  const DiskReadingFile file;
  const DiskReadingOptions options;
  const int urgency;
  const std::uint64_t number;  ///< Grows in the order of coming.

  State state = State::placing;
  std::optional<Platform::URL> volumeURL;
  std::optional<std::uint64_t> place;
  std::uint64_t sweep = 0;           ///< In which the line takes it.
  std::shared_ptr<DiskData> record;  ///< The disk in whose line it stands, or last stood.
  bool hasBegun = false;
  std::optional<DiskReadingResult> verdict;  ///< Why it gets no further turn, while it runs.
  std::atomic<bool>* isTurnEnded = nullptr;  ///< While it runs.
  DiskReadingWatch::Timer timer;             ///< Until its first turn.
  std::chrono::milliseconds pause{};         ///< Before the next offer to its executor.

  /// Made before anybody else knows of the request, and destroyed with it.
  std::optional<std::stop_callback<std::function<void()>>> stopCallback;
};

}  // namespace Varnel
