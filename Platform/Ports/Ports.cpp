// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/Ports.h>

#include <atomic>

namespace Varnel::Platform {
namespace {

// Set once, by the first use or by the host, whichever comes first.
std::atomic<const Ports*> chosenPorts = nullptr;

const Ports* choose(const Ports* ports) {
  const Ports* chosen = nullptr;
  return chosenPorts.compare_exchange_strong(chosen, ports) ? ports : chosen;
}

}  // namespace

const Ports& processPorts() {
  if (const Ports* ports = chosenPorts.load()) return *ports;
  return *choose(&systemPorts());
}

bool installProcessPorts(const Ports& ports) {
  const auto* kept = new Ports(ports);
  if (choose(kept) == kept) return true;
  delete kept;
  return false;
}

}  // namespace Varnel::Platform
