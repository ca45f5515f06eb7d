// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel::Platform::Contract {

/// An application that has just started.
using ApplicationContract = Suite<WorldOf<Application>>;

class ClockWorld : public WorldOf<Clock> {
 public:
  /// Lets some time pass that the clock can tell.
  virtual void pass() = 0;
};
using ClockContract = Suite<ClockWorld>;

/// A queue whose main thread is that of the test.
using MainQueueContract = Suite<WorldOf<MainQueue>>;

class WallClockTimerWorld : public World {
 public:
  /// A timer on the clock that `now` tells. All have the same main thread, that of the test.
  virtual std::unique_ptr<WallClockTimer> timer() = 0;
  virtual Date now() = 0;
  /// Lets time pass, on the main thread, until the condition holds.
  virtual void passUntil(const std::function<bool()>& condition) = 0;
};
using WallClockTimerContract = Suite<WallClockTimerWorld>;

class SoundPlayerWorld : public WorldOf<SoundPlayer> {
 public:
  /// A short sound, and one of which only the beginning is sound.
  virtual std::string sound() = 0;
  virtual std::string damagedSound() = 0;
  virtual std::string noSound() = 0;
  /// Lets sounds play, and the main queue run, until the condition holds.
  virtual void playUntil(const std::function<bool()>& condition) = 0;
};

using SoundPlayerContract = Suite<SoundPlayerWorld>;

}  // namespace Varnel::Platform::Contract
