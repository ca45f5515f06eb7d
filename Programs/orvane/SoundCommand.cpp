// SPDX-License-Identifier: MIT
#include <orvane/SoundCommand.h>

#include <memory>

#include <Varnel/Interface/SoundEngine.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

// Notes how the sound ended, and lets the engine know.
class End final : public Varnel::Platform::SoundDelegate {
 public:
  explicit End(Varnel::SoundEngine& engine) : engine_(engine) {}

  bool hasFinished = false;

  void sound(Varnel::Platform::PlayableSound& sound, bool finished) override {
    hasFinished = finished;
    engine_.sound(sound, finished);
  }

 private:
  Varnel::SoundEngine& engine_;
};

}  // namespace

int SoundCommand::run(Console& console) const {
  const auto problem = playToTheEnd(sound);
  if (problem) console.complain(*problem);
  return problem ? 1 : 0;
}

std::optional<std::string> playToTheEnd(Varnel::Sound sound) {
  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  Varnel::SoundEngine engine;
  engine.play(sound);
  if (!engine.currentSound()) {
    if (auto missing = ports.soundPlayer.get().missingPart()) return missing;
    return sound.fileName() + " is missing or is no sound";
  }
  const auto end = std::make_shared<End>(engine);
  engine.currentSound()->setDelegate(end);
  // The end of the sound arrives on the main queue.
  ports.mainQueue.get().runWhile([&engine] { return engine.currentSound() != nullptr; });
  if (!end->hasFinished)
    return ports.soundPlayer.get().missingPart().value_or("this machine cannot play sounds");
  return std::nullopt;
}

}  // namespace Orvane
