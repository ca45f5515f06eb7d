// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <utility>

#include <Platform/Linux/GStreamer/Sound.h>
#include <Platform/Ports/SoundPlayer.h>

namespace Varnel::Platform::GStreamer {

/// Loads the sounds that the machine's decoders know, and plays them into elements of `makeSink`.
class Player final : public SoundPlayer {
 public:
  explicit Player(SinkMaker makeSink) : makeSink_(std::move(makeSink)) {}

  [[nodiscard]] std::shared_ptr<PlayableSound> load(std::string bytes) override;

 private:
  SinkMaker makeSink_;
};

}  // namespace Varnel::Platform::GStreamer
