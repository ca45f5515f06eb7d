// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/CurrentThread.h>

#include <pthread.h>
#include <sys/resource.h>
#include <unistd.h>

#include <string>

namespace Varnel::Platform {
namespace {

constexpr std::size_t maxNameLength = 15;

int nicenessOf(QualityOfService quality) {
  switch (quality) {
    case QualityOfService::background:
      return 10;
    case QualityOfService::utility:
      return 5;
    case QualityOfService::default_:
    case QualityOfService::userInitiated:
    case QualityOfService::userInteractive:
      break;
  }
  return 0;
}

}  // namespace

void nameCurrentThread(std::string_view name) {
  ::pthread_setname_np(::pthread_self(), std::string(name.substr(0, maxNameLength)).c_str());
}

void setCurrentThreadQuality(QualityOfService quality) {
  // On this system each thread has a niceness of its own. A process that was started as less urgent
  // stays so, and if the system refuses the thread keeps its niceness.
  const int niceness = nicenessOf(quality);
  const auto thread = static_cast<id_t>(::gettid());
  if (niceness > ::getpriority(PRIO_PROCESS, thread)) ::setpriority(PRIO_PROCESS, thread, niceness);
}

}  // namespace Varnel::Platform
