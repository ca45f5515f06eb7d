// SPDX-License-Identifier: MIT
// varnel-notifier: delivers the scheduled notifications of all products of this user, and ends when
// none is left.
#include <malloc.h>

#include <cstdlib>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <varnel-notifier/Notifier.h>

int main() {
  using namespace Varnel::Platform;
  // It sleeps for weeks, and its second thread needs next to nothing.
  ::mallopt(M_ARENA_MAX, 1);
  const auto clock = POSIX::makeClock();
  const auto userLocale = POSIX::makeUserLocale();
  const auto timeZones = Linux::makeTimeZones();
  const auto mainQueue = Linux::makeMainQueue();
  const auto privateFiles = POSIX::makePrivateFiles();
  const auto systemLog = POSIX::makeSystemLog();
  Varnel::Notifier notifier(
      {*clock, *userLocale, *timeZones, *mainQueue, *privateFiles, *systemLog},
      Linux::makeProcessInfo()->executablePath());
  return notifier.run() ? EXIT_SUCCESS : EXIT_FAILURE;
}
