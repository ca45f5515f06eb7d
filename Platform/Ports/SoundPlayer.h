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

  /// Called on the main queue, once for each `play`, unless the sound was stopped before.
  /// `finished` is false when the sound broke off or could not be played, which is not known
  /// earlier. The sound does not play any more, and may be played again at once.
  virtual void sound(PlayableSound& sound, bool finished) = 0;
};

/// A sound that is in memory and can be played. Main thread only. It stops when its last reference
/// is gone.
class VARNEL_API PlayableSound {
 public:
  virtual ~PlayableSound() = default;

  /// The object to call at the end. The sound does not keep it alive.
  virtual void setDelegate(std::weak_ptr<SoundDelegate> delegate) = 0;

  /// Asks the sound to start from its beginning, and returns at once, before it has started. Does
  /// nothing while the sound plays. A play always comes to an end, even without an audio device.
  virtual void play() = 0;

  /// Stops the sound, or cancels a start that has not happened yet. The delegate hears nothing more
  /// of this `play`, even if its end was on the way. Returns at once.
  virtual void stop() = 0;

  /// From `play` to the end or the `stop`.
  [[nodiscard]] virtual bool isPlaying() const = 0;
};

/// Makes sounds that can be played. Main thread only.
class VARNEL_API SoundPlayer {
 public:
  virtual ~SoundPlayer() = default;
  SoundPlayer& operator=(const SoundPlayer&) = delete;

  /// The sound in a file with these bytes. Null when they do not begin like a sound, or when there
  /// is a missing part. All other faults show only when the sound is played, because nothing here
  /// waits for the machine's sound system.
  [[nodiscard]] virtual std::shared_ptr<PlayableSound> load(std::string bytes) = 0;

  /// The name, for a person, of a missing part without which no sound can be played; absent when
  /// nothing is missing. A part that is there but does not work is known only after the end of the
  /// first sound.
  [[nodiscard]] virtual std::optional<std::string> missingPart() const = 0;
};

}  // namespace Varnel::Platform
