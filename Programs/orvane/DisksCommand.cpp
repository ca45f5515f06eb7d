// SPDX-License-Identifier: MIT
#include <orvane/DisksCommand.h>

#include <nlohmann/json.hpp>
#include <optional>
#include <set>
#include <string>

#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/Console.h>
#include <orvane/JSONLine.h>
#include <orvane/LiveDisks.h>

namespace Orvane {
namespace {

using Varnel::OVDiskInfo;
using Varnel::OVDiskKind;
using Varnel::Platform::visibleText;
using Identifier = std::optional<std::string>;

std::string nameOf(OVDiskKind kind) {
  switch (kind) {
    case OVDiskKind::unknown:
      return "unknown";
    case OVDiskKind::solidState:
      return "solid state";
    case OVDiskKind::rotational:
      return "rotational";
    case OVDiskKind::external:
      return "external";
    case OVDiskKind::network:
      return "network";
  }
  return "kind " + std::to_string(static_cast<std::int64_t>(kind));
}

const OVDiskInfo::VolumeURLs& volumesOf(const OVDiskInfo& disk) {
  static const OVDiskInfo::VolumeURLs none;
  return disk.volumeURLs() ? *disk.volumeURLs() : none;
}

/// The identifiers that two inventories agree on. Others are invented anew by each, for what has no
/// identifier of its own, and mean nothing to anyone.
std::set<std::string> lastingIdentifiers(const OVDiskInfo::Array& disks) {
  std::set<std::string> before;
  for (const auto& disk : OVDiskInfo::allDiskInfos()) before.insert(disk->uniqueID().value_or(""));
  std::set<std::string> lasting;
  for (const auto& disk : disks)
    if (disk->uniqueID() && before.contains(*disk->uniqueID())) lasting.insert(*disk->uniqueID());
  return lasting;
}

std::string textOf(const OVDiskInfo& disk, const Identifier& identifier) {
  std::string text = (identifier ? visibleText(*identifier) : "(no identifier)") + ": " +
                     nameOf(disk.kind()) + ", at most " + std::to_string(disk.maxTreads()) +
                     (disk.maxTreads() == 1 ? " reader" : " readers") + "\n";
  for (const auto& volume : volumesOf(disk)) text += "  " + visibleText(volume.path()) + "\n";
  return text;
}

nlohmann::ordered_json jsonOf(const OVDiskInfo& disk, const Identifier& identifier) {
  nlohmann::ordered_json json;
  json["uniqueID"] = identifier ? nlohmann::ordered_json(*identifier) : nullptr;
  json["kind"] = nameOf(disk.kind());
  json["maxReaders"] = disk.maxTreads();
  json["volumes"] = nlohmann::ordered_json::array();
  for (const auto& volume : volumesOf(disk)) json["volumes"].push_back(volume.absoluteString());
  return json;
}

int showLive(bool isJSON, Console& console) {
  const auto notes = Varnel::Platform::processPorts().sessionBoard.get().notes();
  if (!isJSON) return console.writeResult(textOfLiveDisks(notes)) ? 0 : 1;
  const nlohmann::ordered_json json = {{"schemaVersion", schemaVersion},
                                       {"processes", jsonOfLiveDisks(notes)}};
  return console.writeResult(jsonLine(json)) ? 0 : 1;
}

}  // namespace

int DisksCommand::run(Console& console) const {
  if (isLive) return showLive(isJSON, console);
  std::string text;
  nlohmann::ordered_json json = {{"schemaVersion", schemaVersion},
                                 {"disks", nlohmann::ordered_json::array()}};
  const auto disks = OVDiskInfo::allDiskInfos();
  const auto lasting = lastingIdentifiers(disks);
  for (const auto& disk : disks) {
    const Identifier identifier =
        lasting.contains(disk->uniqueID().value_or("")) ? disk->uniqueID() : std::nullopt;
    text += textOf(*disk, identifier);
    json["disks"].push_back(jsonOf(*disk, identifier));
  }
  return console.writeResult(isJSON ? jsonLine(json) : text) ? 0 : 1;
}

}  // namespace Orvane
