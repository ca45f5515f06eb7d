// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>

namespace Varnel::Platform::Contract {

class SoundPlayerWorld : public World {
 public:
  virtual SoundPlayer& player() = 0;
  /// A short sound, and one of which only the beginning is sound.
  virtual std::string sound() = 0;
  virtual std::string damagedSound() = 0;
  virtual std::string noSound() = 0;
  /// Lets sounds play, and the main queue run, until the condition holds.
  virtual void playUntil(const std::function<bool()>& condition) = 0;
};

using SoundPlayerContract = Suite<SoundPlayerWorld>;

}  // namespace Varnel::Platform::Contract
