// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingQueue.h>

#include <utility>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/DiskReadingCore.h>
#include <Varnel/DiskAccess/DiskReadingFiles.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Concurrency/ForkedChild.h>
#include <Varnel/Platform/Ports/Ports.h>

namespace Varnel {
namespace {

unsigned currentProcess() {
  return static_cast<unsigned>(Platform::forksSoFar());
}

}  // namespace

DiskReadingQueue::DiskReadingQueue(DiskAccessManager& manager)
    : DiskReadingQueue(manager, Platform::processPorts()) {}

DiskReadingQueue::DiskReadingQueue(DiskAccessManager& manager, const Platform::Ports& ports)
    : DiskReadingQueue(manager, {.readingPriority = ports.readingPriority}) {}

DiskReadingQueue::DiskReadingQueue(DiskAccessManager& manager, Ports ports)
    : core_(std::make_shared<DiskReadingCore>(manager.state_, std::move(ports))),
      process_(currentProcess()) {
  core_->observeUnmounts();
}

DiskReadingQueue::~DiskReadingQueue() {
  if (process_ == currentProcess())
    core_->close();
  else
    // Its locks are as the threads of the parent left them.
    // NOLINTNEXTLINE(bugprone-unhandled-exception-at-new)
    new auto(core_);
}

DiskReadingQueue& DiskReadingQueue::shared() {
  static DiskReadingQueue& queue = *new DiskReadingQueue(DiskAccessManager::shared());
  return queue;
}

void DiskReadingQueue::read(std::vector<DiskReadingFile> files, DiskReadingOptions options,
                            Read read, DidEnd didEnd) {
  if (process_ != currentProcess()) {
    for (const DiskReadingFile& file : files) didEnd(file, DiskReadingResult::stopped);
  } else if (!files.empty()) {
    std::make_shared<DiskReadingFiles>(core_, std::move(files), std::move(options), std::move(read),
                                       std::move(didEnd))
        ->start();
  }
}

void DiskReadingQueue::submit(std::shared_ptr<DiskReadingTask> task, DiskReadingFile file,
                              DiskReadingOptions options) {
  if (process_ != currentProcess())
    task->didEnd(DiskReadingResult::stopped);
  else
    core_->submit(std::move(task), std::move(file), std::move(options));
}

std::shared_ptr<const OVDiskInfo> DiskReadingQueue::diskOfVolume(
    const Platform::URL& volumeURL) const {
  return core_->disks().knownDiskOfVolume(volumeURL);
}

}  // namespace Varnel
