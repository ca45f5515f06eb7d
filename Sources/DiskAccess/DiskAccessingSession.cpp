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
namespace {

using Use = DiskRecords::Use;

// A place that the thread has from now on.
std::unique_ptr<Use> useBy(Basalt::ThreadID thread, const DiskAccessingSession& session,
                           const Platform::URL& volumeURL) {
  return std::make_unique<Use>(Use{.thread = thread,
                                   .record = session.diskData(),
                                   .volumeURL = volumeURL,
                                   .propose = session.propose(),
                                   .since = std::chrono::steady_clock::now()});
}

}  // namespace

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
  auto use = useBy(thread, *this, volumeURL_);
  // The granting thread shares the request, because it may still be signalling when this thread
  // goes on.
  const auto request = queue.sync([&] {
    if (auto used = records_->usedBy(thread, volumeURL_)) diskData_ = std::move(used);
    use->record = diskData_;
    auto pending = diskData_->requestAccess(thread, qos);
    if (!pending) {
      use->since = std::chrono::steady_clock::now();
      records_->add(std::move(use));
    }
    return pending;
  });
  if (!request) return true;
  const Platform::Date now =
      std::chrono::floor<Platform::Date::duration>(std::chrono::system_clock::now());
  const bool isSignalled = request->sema.waitUntil(waitingDeadline(now, waitingTimeout));
  if (!isSignalled && request->claim()) return false;
  use->since = std::chrono::steady_clock::now();
  queue.sync([&] {
    diskData_->confirmAccess(thread);
    records_->add(std::move(use));
  });
  return true;
}

void DiskAccessingSession::passFrom(Basalt::ThreadID thread) {
  const Basalt::ThreadID current = Basalt::currentThreadID();
  auto use = useBy(current, *this, volumeURL_);
  std::unique_ptr<Use> removed;
  diskData_->queue().sync([&] {
    diskData_->confirmAccess(current);
    records_->add(std::move(use));
    diskData_->releaseAccess(thread);
    removed = records_->remove(thread, diskData_, volumeURL_);
  });
}

void DiskAccessingSession::endAccessing() {
  isAccessing_ = false;
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  const auto removed = diskData_->queue().sync([&] {
    diskData_->releaseAccess(thread);
    return records_->remove(thread, diskData_, volumeURL_);
  });
  if (secureScope_) scopes_->endAccessingSecurityScopedResource(url_, propose_);
}

}  // namespace Varnel
