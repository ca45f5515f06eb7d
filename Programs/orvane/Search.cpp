// SPDX-License-Identifier: MIT
#include <orvane/Search.h>

#include <algorithm>
#include <optional>
#include <thread>

#include <Scan/DuplicateFinder.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane/ManagedDiskTurns.h>
#include <orvane/ProgressLine.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

unsigned maxReaders() {
  const unsigned cores = std::thread::hardware_concurrency();
  return std::max(2u, Varnel::Globals::canUseAllCores() ? cores : cores / 2);
}

}  // namespace

ScanResult search(const ScanRequest& request, SearchManner manner, ScanObserver& observer,
                  Console& console, ScanControl& control) {
  const Varnel::DiskAccessWatcher watcher(manner.program);
  ManagedDiskTurns turns({.queue = ManagedDiskTurns::sharedQueue(),
                          .volumes = Varnel::Platform::processPorts().volumeCatalog},
                         manner.qos, maxReaders());
  DuplicateFinder finder(
      {.fileSystem = systemFileSystem(manner.cacheUse), .turns = turns, .observer = observer});
  std::optional<ProgressLine> progress;
  if (manner.showsProgress && isStandardErrorATerminal()) progress.emplace(console, control);
  return finder.find(request, control);
}

}  // namespace Orvane
