// SPDX-License-Identifier: MIT
#include <orvane/SoundCommand.h>

#include <Platform/Ports/MainQueue.h>
#include <Platform/Ports/Ports.h>
#include <Varnel/Interface/SoundEngine.h>
#include <orvane/Console.h>

namespace Orvane {

int SoundCommand::run(Console& console) const {
  if (playToTheEnd(sound)) return 0;
  console.complain("this machine cannot play sounds");
  return 1;
}

bool playToTheEnd(Varnel::Sound sound) {
  Varnel::SoundEngine engine;
  engine.play(sound);
  if (!engine.currentSound()) return false;
  // The end of the sound arrives on the main queue.
  Varnel::Platform::processPorts().mainQueue.runWhile(
      [&engine] { return engine.currentSound() != nullptr; });
  return true;
}

}  // namespace Orvane
