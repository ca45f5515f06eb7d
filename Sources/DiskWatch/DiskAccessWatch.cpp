// SPDX-License-Identifier: MIT
#include <Varnel/DiskWatch/DiskAccessWatch.h>

#include <algorithm>
#include <chrono>
#include <utility>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskWatch/DiskAccessNote.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Ports/SessionBoard.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Varnel {
namespace {

constexpr std::chrono::minutes maxTimeHeld{1};

}  // namespace

DiskAccessWatch::DiskAccessWatch(Ports ports, std::string program)
    : ports_(ports), program_(std::move(program)) {}

DiskAccessWatch::~DiskAccessWatch() {
  ports_.board.withdraw();
}

void DiskAccessWatch::look(Time now) {
  const auto disks = ports_.manager.snapshots();
  warn(disks, now);
  std::string text = DiskAccessNote(program_, disks, now).text();
  // Where there is no board nobody can look at it either.
  if (text != posted_ && !ports_.board.post(text)) posted_ = std::move(text);
}

void DiskAccessWatch::warn(const std::vector<DiskAccessSnapshot>& disks, Time now) {
  std::vector<Place> overlong;
  for (const DiskAccessSnapshot& disk : disks)
    for (const Place& place : disk.places) {
      if (now - place.since <= maxTimeHeld) continue;
      overlong.push_back(place);
      if (std::find(overlong_.begin(), overlong_.end(), place) != overlong_.end()) continue;
      log("Warning: a place on the disk \"" +
          Platform::visibleText(disk.disk->uniqueID().value_or("")) +
          "\" has been held for longer than a minute, for \"" +
          Platform::visibleText(place.propose) + "\"");
    }
  overlong_ = std::move(overlong);
}

}  // namespace Varnel
