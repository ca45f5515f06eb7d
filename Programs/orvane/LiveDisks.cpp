// SPDX-License-Identifier: MIT
#include <orvane/LiveDisks.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <map>

#include <nlohmann/json.hpp>

#include <Varnel/DiskWatch/DiskAccessNote.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Orvane {
namespace {

using Varnel::DiskAccessNote;
using Varnel::Platform::visibleText;

constexpr std::array<const char*, 4> classNames{"user-interactive", "user-initiated", "utility",
                                                "background"};

std::multimap<std::int64_t, DiskAccessNote> read(const Notes& notes) {
  std::multimap<std::int64_t, DiskAccessNote> processes;
  for (const auto& posted : notes)
    if (auto note = DiskAccessNote::fromText(posted.text))
      processes.emplace(posted.process, std::move(*note));
  return processes;
}

std::string secondsText(double seconds) {
  std::array<char, 32> text{};
  std::snprintf(text.data(), text.size(), seconds < 1e9 ? "%.3f s" : "%.0e s", seconds);
  return text.data();
}

// "    what: 2 utility, 1 background", or nothing when nobody waits.
std::string textOf(const char* what, const DiskAccessNote::Waiters& waiters) {
  std::string text;
  for (std::size_t i = 0; i < waiters.size(); ++i)
    if (waiters[i] > 0)
      text += (text.empty() ? "    " + std::string(what) + ": " : ", ") +
              std::to_string(waiters[i]) + " " + classNames[i];
  return text.empty() ? text : text + "\n";
}

std::string textOf(const DiskAccessNote::Disk& disk) {
  std::string text = "  " + visibleText(disk.uniqueID);
  if (!disk.volume.empty()) text += " (" + visibleText(disk.volume) + ")";
  text += ": " + std::to_string(disk.places.size()) + " of " + std::to_string(disk.maxReaders) +
          (disk.maxReaders == 1 ? " place\n" : " places\n");
  for (const auto& place : disk.places)
    text += "    for " + secondsText(place.seconds) + ": " + visibleText(place.propose) + "\n";
  return text + textOf("waiting", disk.waiters) +
         textOf("waiting for other processes", disk.waitersForProcesses);
}

nlohmann::ordered_json jsonOf(const DiskAccessNote::Disk& disk) {
  nlohmann::ordered_json json = {{"uniqueID", disk.uniqueID},
                                 {"volume", disk.volume},
                                 {"maxReaders", disk.maxReaders},
                                 {"places", nlohmann::ordered_json::array()}};
  for (const auto& place : disk.places)
    json["places"].push_back({{"propose", place.propose}, {"seconds", place.seconds}});
  json["waiters"] = disk.waiters;
  json["waitersForProcesses"] = disk.waitersForProcesses;
  return json;
}

}  // namespace

std::string textOfLiveDisks(const Notes& notes) {
  std::string text;
  for (const auto& [process, note] : read(notes)) {
    text += visibleText(note.program) + " (" + std::to_string(process) + ")\n";
    for (const auto& disk : note.disks) text += textOf(disk);
  }
  return text.empty() ? "no process tells of its disks\n" : text;
}

nlohmann::ordered_json jsonOfLiveDisks(const Notes& notes) {
  auto processes = nlohmann::ordered_json::array();
  for (const auto& [process, note] : read(notes)) {
    nlohmann::ordered_json json = {{"process", process},
                                   {"program", note.program},
                                   {"disks", nlohmann::ordered_json::array()}};
    for (const auto& disk : note.disks) json["disks"].push_back(jsonOf(disk));
    processes.push_back(std::move(json));
  }
  return processes;
}

}  // namespace Orvane
