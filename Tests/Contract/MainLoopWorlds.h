// SPDX-License-Identifier: MIT
#pragma once

#include <functional>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel::Platform::Contract {

/// An application that has just started.
class ApplicationWorld : public World {
 public:
  virtual Platform::Application& application() = 0;
};
using ApplicationContract = Suite<ApplicationWorld>;

class ClockWorld : public World {
 public:
  virtual Clock& clock() = 0;
  /// Lets some time pass that the clock can tell.
  virtual void pass() = 0;
};
using ClockContract = Suite<ClockWorld>;

/// A queue whose main thread is that of the test.
class MainQueueWorld : public World {
 public:
  virtual MainQueue& queue() = 0;
};
using MainQueueContract = Suite<MainQueueWorld>;

class WallClockTimerWorld : public World {
 public:
  /// A timer on the clock that `now` tells. All have the same main thread, that of the test.
  virtual std::unique_ptr<WallClockTimer> timer() = 0;
  virtual Date now() = 0;
  /// Lets time pass, on the main thread, until the condition holds.
  virtual void passUntil(const std::function<bool()>& condition) = 0;
};
using WallClockTimerContract = Suite<WallClockTimerWorld>;

}  // namespace Varnel::Platform::Contract
