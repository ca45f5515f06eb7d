// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>

#include <Varnel/Interface/Sound.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>

namespace Varnel::Platform {
struct Ports;
}

namespace Varnel {

/// Plays one of the framework's sounds at a time. A new one cuts off the one before it; there is no
/// queue and no mixing.
///
///     SoundEngine engine;
///     engine.setSoundsEnabled(preferences.sounds);
///     engine.play(Sound::scanComplete);
///
/// Missing or damaged sounds are silently ignored, and so is a machine that cannot play any. Main
/// thread only; the end of a sound is noticed when the main queue runs. Destroying the engine stops
/// its sound.
class VARNEL_API SoundEngine final : private Platform::SoundDelegate {
 public:
  /// Where the resource of a sound is; absent when there is none.
  using PathOfSound = std::function<std::optional<std::string>(Sound)>;

  /// The player outlives the engine.
  struct Ports {
    Platform::SoundPlayer& player;
    PathOfSound path;
  };

  /// An engine for the framework's own sounds and the process's player.
  SoundEngine();
  explicit SoundEngine(Ports ports);
  explicit SoundEngine(const Platform::Ports& ports);
  SoundEngine(const SoundEngine&) = delete;
  SoundEngine& operator=(const SoundEngine&) = delete;
  ~SoundEngine() override;

  /// Stops and forgets the current sound, then starts this one if it can be loaded. While sounds
  /// are not enabled it does nothing at all.
  void play(Sound sound);

  /// Stops and forgets the current sound, if any.
  void stop();

  /// A sound has come to its end. Calls `stop`, whichever sound it was.
  void sound(Platform::PlayableSound& sound, bool didFinishPlaying) override;

  /// The sound that is being played; null for none. Assigning starts and stops nothing by itself,
  /// but a sound that is no longer referred to falls silent.
  [[nodiscard]] const std::shared_ptr<Platform::PlayableSound>& currentSound() const {
    return currentSound_;
  }
  void setCurrentSound(std::shared_ptr<Platform::PlayableSound> sound) {
    currentSound_ = std::move(sound);
  }

  /// Whether `play` plays; true at first. Muting does not stop a sound that is playing.
  [[nodiscard]] bool soundsEnabled() const { return soundsEnabled_; }
  void setSoundsEnabled(bool enabled) { soundsEnabled_ = enabled; }

 private:
  Ports ports_;
  std::shared_ptr<Platform::PlayableSound> currentSound_;
  bool soundsEnabled_ = true;
  /// Refers to the engine as long as it exists; sounds may outlive it.
  std::shared_ptr<Platform::SoundDelegate> delegate_;
};

}  // namespace Varnel
