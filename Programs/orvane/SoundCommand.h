// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Interface/Sound.h>

namespace Orvane {

class Console;

/// `orvane sound`: plays one of the framework's sounds to its end.
struct SoundCommand {
  Varnel::Sound::Case sound = Varnel::Sound::Case::start;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

/// Plays a sound and waits for its end. False when this machine cannot play it. Main thread only.
bool playToTheEnd(Varnel::Sound sound);

}  // namespace Orvane
