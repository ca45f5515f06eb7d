// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace Varnel::Platform {

/// What a `BackgroundSoundPlayer` plays its sounds into. All operations may be slow. One thread at
/// a time.
class SoundOutput {
 public:
  /// A sound that is being played. Destroying it is silence, and `ended` is called no more.
  class Playback {
   public:
    virtual ~Playback() = default;
  };
  /// Called at the end, with whether the sound ended by itself. From any thread; may be called
  /// twice.
  using Ended = std::function<void(bool finished)>;

  virtual ~SoundOutput() = default;

  /// Starts to play the file with these bytes; null when that fails.
  [[nodiscard]] virtual std::unique_ptr<Playback> start(const std::string& bytes, Ended ended) = 0;
};

}  // namespace Varnel::Platform
