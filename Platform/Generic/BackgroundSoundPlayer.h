// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

#include <Varnel/Platform/Generic/SoundOutput.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>

namespace Varnel::Platform {

class MainQueue;

/// Plays sounds into an output with slow operations, on a thread of its own.
///
///     BackgroundSoundPlayer player(mainQueue, [] { return std::make_unique<Output>(); });
///
/// The caller never waits. A sound that cannot be played comes to its end as any other, with
/// `finished` false. The main queue outlives the player and its sounds.
class BackgroundSoundPlayer final : public SoundPlayer {
 public:
  /// Called once, on the thread, before the first sound; null when the machine cannot play any.
  using OutputMaker = std::function<std::unique_ptr<SoundOutput>()>;

  BackgroundSoundPlayer(MainQueue& mainQueue, OutputMaker makeOutput);
  /// Waits until the thread has finished its present job.
  ~BackgroundSoundPlayer() override;
  BackgroundSoundPlayer(const BackgroundSoundPlayer&) = delete;
  BackgroundSoundPlayer& operator=(const BackgroundSoundPlayer&) = delete;

  [[nodiscard]] std::shared_ptr<PlayableSound> load(std::string bytes) override;
  [[nodiscard]] std::optional<std::string> missingPart() const override { return std::nullopt; }

 private:
  class Sound;
  class Worker;

  MainQueue& mainQueue_;
  const std::shared_ptr<Worker> worker_;
};

}  // namespace Varnel::Platform
