// SPDX-License-Identifier: MIT
#include <algorithm>
#include <utility>

#include <Varnel/DiskAccess/DiskReadingCore.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

// How a worker gets onto a disk whose places several processes share.

namespace Varnel {

using Platform::SessionBoard;

std::optional<std::string> DiskReadingCore::sharedNameOf(const DiskData& record) const {
  return ports_.sharedPlaces ? disks_->sharedNameOf(record) : std::nullopt;
}

// A worker never waits for the one place while it has the other: it would keep the processes, or
// the other threads of this one, waiting for what it does not use. Where it had to wait last it has
// a place when it tries the other.
DiskReadingCore::Admission DiskReadingCore::admit(const std::shared_ptr<DiskData>& record,
                                                  const std::optional<std::string>& sharedName,
                                                  const DiskAccessState::Access& access) const {
  auto session = disks_->begin(record, access);
  if (!sharedName) return {std::move(session), nullptr};
  const auto count = static_cast<unsigned>(
      std::clamp<std::int64_t>(record->diskInfo()->maxTreads(), 1, maxWorkers));
  const auto take = [&](SessionBoard::Wait wait) {
    return ports_.sharedPlaces->takePlace(*sharedName, count, wait);
  };
  const int urgency = urgencyClassOf(access.qos);
  while (session) {
    if (auto place = take(SessionBoard::Wait::no)) return {std::move(session), std::move(place)};
    session->endAccessing();
    session.reset();
    if (access.waitingTimeout) break;  // It does not wait at all.
    disks_->setWaitsForProcesses(record, urgency, true);
    auto place = take(SessionBoard::Wait::forPlace);
    disks_->setWaitsForProcesses(record, urgency, false);
    auto impatient = access;
    impatient.waitingTimeout = 0;
    session = disks_->begin(record, impatient);
    if (session) return {std::move(session), std::move(place)};
    place.reset();
    session = disks_->begin(record, access);
  }
  return {};
}

}  // namespace Varnel
