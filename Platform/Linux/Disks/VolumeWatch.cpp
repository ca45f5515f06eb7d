// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/VolumeWatch.h>

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <iterator>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Varnel::Platform::Linux {
namespace {

void appendMissing(std::vector<VolumeChange>& changes, VolumeChange::Kind kind,
                   const VolumeTable& some, const VolumeTable& others) {
  for (const Volume& volume : some.volumes) {
    const Volume* same = others.withMountID(volume.mountID);
    if (!same || !same->isSameMount(volume))
      changes.push_back({.kind = kind, .volumeURL = volume.url});
  }
}

}  // namespace

std::vector<VolumeChange> changesBetween(const VolumeTable& before, const VolumeTable& after) {
  std::vector<VolumeChange> changes;
  appendMissing(changes, VolumeChange::Kind::unmounted, before, after);
  appendMissing(changes, VolumeChange::Kind::mounted, after, before);
  return changes;
}

VolumeWatch::VolumeWatch(std::shared_ptr<MountTable> table, VolumeCatalog::ChangeHandler handler)
    : table_(std::move(table)),
      handler_(std::move(handler)),
      mountInfo_(openMountInfo()),
      stop_(::eventfd(0, EFD_CLOEXEC)) {}

std::unique_ptr<VolumeWatch> VolumeWatch::start(std::shared_ptr<MountTable> table,
                                                VolumeCatalog::ChangeHandler handler) {
  std::unique_ptr<VolumeWatch> watch(new VolumeWatch(std::move(table), std::move(handler)));
  return watch->begin() ? std::move(watch) : nullptr;
}

bool VolumeWatch::begin() {
  if (!mountInfo_ || !stop_) return false;
  // The file above counts changes from the moment it was opened, so none is missed before this
  // point.
  told_ = table_->current();
  if (!told_) return false;
  try {
    thread_ = startThread("volume-watch", [this] { run(); });
  } catch (const std::system_error&) {
    return false;
  }
  return true;
}

VolumeWatch::~VolumeWatch() {
  if (!thread_.joinable()) return;
  const std::uint64_t one = 1;
  while (::write(stop_.get(), &one, sizeof one) < 0 && errno == EINTR) continue;
  thread_.join();
}

void VolumeWatch::run() {
  pollfd waiting[] = {{.fd = mountInfo_.get(), .events = POLLPRI, .revents = 0},
                      {.fd = stop_.get(), .events = POLLIN, .revents = 0}};
  for (;;) {
    if (::poll(waiting, std::size(waiting), -1) < 0) {
      if (errno == EINTR) continue;
      return;
    }
    if (waiting[1].revents != 0) return;
    const auto now = table_->current();
    if (!now || now == told_) continue;
    for (const VolumeChange& change : changesBetween(*told_, *now)) handler_(change);
    told_ = now;
  }
}

}  // namespace Varnel::Platform::Linux
