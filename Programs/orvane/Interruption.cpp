// SPDX-License-Identifier: MIT
#include <orvane/Interruption.h>

#include <csignal>

#include <orvane/Console.h>

namespace Orvane {
namespace {

constexpr int signals[] = {SIGINT, SIGTERM, SIGHUP};

// What a signal handler may touch: atomics that need no lock.
std::atomic<std::atomic<bool>*> flagToSet{nullptr};
std::atomic<int> caughtSignal{0};
static_assert(std::atomic<std::atomic<bool>*>::is_always_lock_free);

extern "C" void interrupt(int signal) {
  // The signal is blocked here, and ends the program when this returns.
  if (caughtSignal.exchange(signal) != 0) {
    Console::eraseStatusInHandler();
    (void)std::signal(signal, SIG_DFL);
    (void)std::raise(signal);
    return;
  }
  if (std::atomic<bool>* flag = flagToSet) *flag = true;
}

}  // namespace

Interruption::Interruption(std::atomic<bool>& flag) {
  caughtSignal = 0;
  flagToSet = &flag;
  for (const int signal : signals) {
    // What the program was started to ignore (by nohup, say) stays ignored.
    if (std::signal(signal, interrupt) == SIG_IGN) (void)std::signal(signal, SIG_IGN);
  }
}

Interruption::~Interruption() {
  for (const int signal : signals) {
    if (std::signal(signal, SIG_DFL) == SIG_IGN) (void)std::signal(signal, SIG_IGN);
  }
  flagToSet = nullptr;
}

int Interruption::signal() const {
  return caughtSignal;
}

}  // namespace Orvane
