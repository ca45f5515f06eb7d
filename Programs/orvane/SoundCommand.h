// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include <Varnel/Interface/Sound.h>

namespace Orvane {

class Console;

/// `orvane sound`: plays one of the framework's sounds to its end.
struct SoundCommand {
  Varnel::Sound::Case sound = Varnel::Sound::Case::start;

  /// Runs the command and returns the program's exit status.
  [[nodiscard]] int run(Console& console) const;
};

/// Plays a sound and waits for its end. Returns the error, or nothing. Main thread only.
std::optional<std::string> playToTheEnd(Varnel::Sound sound);

}  // namespace Orvane
