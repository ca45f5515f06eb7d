// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A sound that makes no noise and ends when the test says so.
class FakeSound final : public PlayableSound {
 public:
  explicit FakeSound(std::string content) : bytes(std::move(content)) {}

  const std::string bytes;
  int timesStopped = 0;

  void setDelegate(std::weak_ptr<SoundDelegate> delegate) override {
    delegate_ = std::move(delegate);
  }
  void play() override { isPlaying_ = true; }
  void stop() override {
    if (std::exchange(isPlaying_, false)) ++timesStopped;
  }
  [[nodiscard]] bool isPlaying() const override { return isPlaying_; }

  /// The sound comes to its end by itself; nothing unless it plays.
  void end(bool finished = true) {
    if (!std::exchange(isPlaying_, false)) return;
    if (const auto delegate = delegate_.lock()) delegate->sound(*this, finished);
  }

 private:
  std::weak_ptr<SoundDelegate> delegate_;
  bool isPlaying_ = false;
};

/// A sound player that remembers what it loaded. It refuses the bytes "broken", and none at all.
class FakeSoundPlayer final : public SoundPlayer {
 public:
  /// The calls of `load`, which never waits.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::vector<std::shared_ptr<FakeSound>> sounds;  ///< Every sound loaded, in order.

  [[nodiscard]] std::shared_ptr<PlayableSound> load(std::string bytes) override {
    const Fault fault = faults->next();
    const bool isSound = !bytes.empty() && bytes != "broken";
    if (!isSound || fault == Fault::fails || fault == Fault::absent) return nullptr;
    const auto sound = sounds.emplace_back(std::make_shared<FakeSound>(std::move(bytes)));
    // It stops with the last reference outside.
    return {sound.get(), [sound](PlayableSound*) { sound->stop(); }};
  }
  [[nodiscard]] std::optional<std::string> missingPart() const override { return std::nullopt; }
};

}  // namespace Varnel::Platform::Testing
