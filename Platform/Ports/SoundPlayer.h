// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

class PlayableSound;

/// Is told when a sound has come to its end.
class VARNEL_API SoundDelegate {
 public:
  virtual ~SoundDelegate() = default;

  /// Called on the main queue, once a `play`, unless the sound was stopped before. `finished` is
  /// false when it broke off or could not be played at all, which shows only then.
  virtual void sound(PlayableSound& sound, bool finished) = 0;
};

/// A sound that is in memory and can be played. Main thread only. Letting go of the last reference
/// stops it.
class VARNEL_API PlayableSound {
 public:
  virtual ~PlayableSound() = default;

  /// Whom to tell about the end. The sound does not keep it alive.
  virtual void setDelegate(std::weak_ptr<SoundDelegate> delegate) = 0;

  /// Has the sound start from its beginning and returns at once, before it has; nothing while it
  /// plays. Always comes to an end, even without an audio device.
  virtual void play() = 0;

  /// Silence, or no start where it had not come to that. The delegate hears nothing more of this
  /// `play`, even if its end was on the way. Returns at once.
  virtual void stop() = 0;

  /// From `play` to the end or the `stop`.
  [[nodiscard]] virtual bool isPlaying() const = 0;
};

/// Makes sounds that can be played. Main thread only.
class VARNEL_API SoundPlayer {
 public:
  virtual ~SoundPlayer() = default;

  /// The sound that a file with these bytes holds. Null when they do not begin like a sound, or
  /// when there is a missing part. Whatever else there is to find out is found out by playing:
  /// nothing here waits for the machine's sound system.
  [[nodiscard]] virtual std::shared_ptr<PlayableSound> load(std::string bytes) = 0;

  /// The part without which no sound can be played, in words for a person; absent when it is there.
  /// One that is there and does not work is known after the end of the first sound.
  [[nodiscard]] virtual std::optional<std::string> missingPart() const = 0;
};

}  // namespace Varnel::Platform
