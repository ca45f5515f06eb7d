// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace Varnel::Platform {

/// What a `BackgroundSoundPlayer` plays its sounds into. All operations may take their time; one
/// thread at a time.
class SoundOutput {
 public:
  /// A sound that is being played. Destroying it is silence, and `ended` is called no more.
  class Playback {
   public:
    virtual ~Playback() = default;
  };
  /// Told about the end, and whether it was the sound's own. From any thread; may call twice.
  using Ended = std::function<void(bool finished)>;

  virtual ~SoundOutput() = default;

  /// Starts to play the file with these bytes; null when it cannot.
  [[nodiscard]] virtual std::unique_ptr<Playback> start(const std::string& bytes, Ended ended) = 0;
};

}  // namespace Varnel::Platform
