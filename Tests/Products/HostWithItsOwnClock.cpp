// SPDX-License-Identifier: MIT
// Logs by a clock that stands still, and tells whether that clock alone is not the system's.
#include <chrono>
#include <cstdlib>
#include <iostream>

#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

using namespace Varnel;

int main() {
  const Platform::Ports& system = Platform::systemPorts();
  const Platform::Clock* systemClock = &system.clock.get();
  static auto& clock = *new Platform::Testing::SimulatedClock(
      Platform::Date(std::chrono::sys_days(std::chrono::days(14))));  // in 1970
  Platform::Ports ports = system;
  ports.clock = clock;
  if (!installProcessPorts(ports)) return EXIT_FAILURE;

  Logger::instance().log("logged");
  const bool isOnlyTheClockOurs =
      &Platform::processPorts().clock.get() == &clock && &system.clock.get() == systemClock &&
      &Platform::processPorts().timeZones.get() == &system.timeZones.get();
  std::cout << (isOnlyTheClockOurs ? "one replaced" : "others replaced") << std::endl;
  return installProcessPorts(system) ? EXIT_FAILURE : EXIT_SUCCESS;
}
