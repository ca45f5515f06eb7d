// SPDX-License-Identifier: MIT
#include <orvane/Interruption.h>

#include <pthread.h>
#include <signal.h>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

constexpr int signals[] = {SIGINT, SIGTERM, SIGHUP};
constexpr int wakeUp = SIGURG;  ///< Nobody minds one that comes from elsewhere.

// What the program was started to ignore (by nohup, say) stays ignored.
bool isIgnored(int signal) {
  struct sigaction action {};
  return ::sigaction(signal, nullptr, &action) == 0 && action.sa_handler == SIG_IGN;
}

void end(int signal) {
  Console::eraseStatusInHandler();
  sigset_t only{};
  ::sigemptyset(&only);
  ::sigaddset(&only, signal);
  ::pthread_sigmask(SIG_UNBLOCK, &only, nullptr);
  (void)::raise(signal);
}

}  // namespace

// All threads of the framework have signals blocked, so that those of the process come to this one.
Interruption::Interruption(std::atomic<bool>& flag) : flag_(flag) {
  ::sigemptyset(&awaited_);
  ::sigaddset(&awaited_, wakeUp);
  for (const int signal : signals)
    if (!isIgnored(signal)) ::sigaddset(&awaited_, signal);
  ::pthread_sigmask(SIG_BLOCK, &awaited_, &blockedBefore_);
  thread_ = Varnel::Platform::startThread("signals", [this] { wait(); });
}

Interruption::~Interruption() {
  isOver_ = true;
  ::pthread_kill(thread_.native_handle(), wakeUp);
  thread_.join();
  ::pthread_sigmask(SIG_SETMASK, &blockedBefore_, nullptr);
}

void Interruption::wait() {
  int signal = 0;
  while (::sigwait(&awaited_, &signal) == 0 && !isOver_) {
    if (signal == wakeUp) continue;
    if (signal_.exchange(signal) != 0) end(signal);
    flag_ = true;
  }
}

}  // namespace Orvane
