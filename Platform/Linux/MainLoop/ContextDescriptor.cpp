// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/MainLoop/ContextDescriptor.h>

#include <sys/epoll.h>
#include <sys/timerfd.h>

#include <limits>
#include <vector>

namespace Varnel::Platform::Linux {
namespace {

bool watch(int all, int descriptor, unsigned events) {
  epoll_event event{};
  // The flags of poll and epoll have the same values.
  event.events = events;
  event.data.fd = descriptor;
  // By now the number may stand for another file, which is not registered with the kernel yet.
  return ::epoll_ctl(all, EPOLL_CTL_MOD, descriptor, &event) == 0 ||
         ::epoll_ctl(all, EPOLL_CTL_ADD, descriptor, &event) == 0;
}

}  // namespace

ContextDescriptor::ContextDescriptor(GMainContext* context)
    : context_(context),
      all_(::epoll_create1(EPOLL_CLOEXEC)),
      timer_(::timerfd_create(CLOCK_MONOTONIC, TFD_CLOEXEC | TFD_NONBLOCK)) {
  g_main_context_acquire(context_);
  watch(all_.get(), timer_.get(), EPOLLIN);
}

ContextDescriptor::~ContextDescriptor() {
  g_main_context_release(context_);
}

int ContextDescriptor::refreshed() {
  int timeout = 0;
  Events events = query(timeout);
  for (const auto& [descriptor, unused] : watched_)
    if (!events.contains(descriptor)) ::epoll_ctl(all_.get(), EPOLL_CTL_DEL, descriptor, nullptr);
  for (const auto& [descriptor, wanted] : events)
    // A file that cannot be watched, such as a plain file, is always ready.
    if (!watch(all_.get(), descriptor, wanted)) timeout = 0;
  watched_ = std::move(events);
  setTimer(timeout);
  return all_.get();
}

ContextDescriptor::Events ContextDescriptor::query(int& timeoutMilliseconds) const {
  int priority = 0;
  g_main_context_prepare(context_, &priority);
  std::vector<GPollFD> polled(16);
  const auto ask = [&] {
    return g_main_context_query(context_, std::numeric_limits<int>::max(), &timeoutMilliseconds,
                                polled.data(), static_cast<int>(polled.size()));
  };
  int count = ask();
  while (count > static_cast<int>(polled.size())) {
    polled.resize(static_cast<std::size_t>(count));
    count = ask();
  }
  polled.resize(static_cast<std::size_t>(count));
  Events events;
  for (const GPollFD& entry : polled) events[entry.fd] |= entry.events;
  return events;
}

void ContextDescriptor::setTimer(int timeoutMilliseconds) const {
  itimerspec when{};
  if (timeoutMilliseconds > 0) {
    when.it_value.tv_sec = timeoutMilliseconds / 1000;
    when.it_value.tv_nsec = (timeoutMilliseconds % 1000) * 1'000'000L;
  } else if (timeoutMilliseconds == 0) {
    when.it_value.tv_nsec = 1;
  }
  ::timerfd_settime(timer_.get(), 0, &when, nullptr);
}

}  // namespace Varnel::Platform::Linux
