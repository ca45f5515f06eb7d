// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskAccessingSession.h>

#include <chrono>
#include <utility>

#include <Varnel/Basalt/SecurityScopeBookkeeping.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/DiskRecords.h>
#include <Varnel/DiskAccess/WaitingDeadline.h>

namespace Varnel {

DiskAccessingSession::DiskAccessingSession(Platform::URL url, std::string propose, bool secureScope,
                                           std::shared_ptr<DiskData> diskData,
                                           Platform::URL volumeURL,
                                           std::shared_ptr<DiskRecords> records,
                                           std::shared_ptr<SecurityScopes> scopes)
    : url_(std::move(url)),
      propose_(std::move(propose)),
      secureScope_(secureScope),
      diskData_(std::move(diskData)),
      volumeURL_(std::move(volumeURL)),
      records_(std::move(records)),
      scopes_(std::move(scopes)) {}

const std::shared_ptr<const OVDiskInfo>& DiskAccessingSession::diskInfo() const {
  return diskData_->diskInfo();
}

bool DiskAccessingSession::beginAccessing(Platform::QualityOfService qos,
                                          std::optional<Platform::TimeInterval> waitingTimeout) {
  if (secureScope_ && !scopes_->beginAccessingSecurityScopedResource(url_, propose_)) return false;
  isAccessing_ = waitForAdmission(qos, waitingTimeout);
  return isAccessing_;
}

bool DiskAccessingSession::waitForAdmission(Platform::QualityOfService qos,
                                            std::optional<Platform::TimeInterval> waitingTimeout) {
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  Basalt::SerialQueue& queue = diskData_->queue();
  // The granting thread shares the request, because it may still be signalling when this thread
  // goes on.
  const auto request = queue.sync([&] {
    if (auto used = records_->usedBy(thread, volumeURL_)) diskData_ = std::move(used);
    auto pending = diskData_->requestAccess(thread, qos);
    if (!pending) addUseBy(thread);
    return pending;
  });
  if (!request) return true;
  const Platform::Date now =
      std::chrono::floor<Platform::Date::duration>(std::chrono::system_clock::now());
  const bool isSignalled = request->sema.waitUntil(waitingDeadline(now, waitingTimeout));
  if (!isSignalled && request->claim()) return false;
  queue.sync([&] {
    diskData_->confirmAccess(thread);
    addUseBy(thread);
  });
  return true;
}

void DiskAccessingSession::addUseBy(Basalt::ThreadID thread) const {
  records_->add({.thread = thread,
                 .record = diskData_,
                 .volumeURL = volumeURL_,
                 .propose = propose_,
                 .since = std::chrono::steady_clock::now()});
}

void DiskAccessingSession::passFrom(Basalt::ThreadID thread) {
  const Basalt::ThreadID current = Basalt::currentThreadID();
  diskData_->queue().sync([&] {
    diskData_->confirmAccess(current);
    addUseBy(current);
    diskData_->releaseAccess(thread);
    records_->remove(thread, diskData_, volumeURL_);
  });
}

void DiskAccessingSession::endAccessing() {
  isAccessing_ = false;
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  diskData_->queue().sync([&] {
    diskData_->releaseAccess(thread);
    records_->remove(thread, diskData_, volumeURL_);
  });
  if (secureScope_) scopes_->endAccessingSecurityScopedResource(url_, propose_);
}

}  // namespace Varnel
