// SPDX-License-Identifier: MIT
#include <orvane/DisksCommand.h>

#include <nlohmann/json.hpp>
#include <string>

#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/Console.h>
#include <orvane/JSONLine.h>

namespace Orvane {
namespace {

using Varnel::OVDiskInfo;
using Varnel::OVDiskKind;
using Varnel::Platform::visibleText;

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

std::string textOf(const OVDiskInfo& disk) {
  std::string text = visibleText(disk.uniqueID().value_or("?")) + ": " + nameOf(disk.kind()) +
                     ", at most " + std::to_string(disk.maxTreads()) +
                     (disk.maxTreads() == 1 ? " reader" : " readers") + "\n";
  for (const auto& volume : volumesOf(disk)) text += "  " + visibleText(volume.path()) + "\n";
  return text;
}

nlohmann::ordered_json jsonOf(const OVDiskInfo& disk) {
  nlohmann::ordered_json json;
  json["uniqueID"] = disk.uniqueID() ? nlohmann::ordered_json(*disk.uniqueID()) : nullptr;
  json["kind"] = nameOf(disk.kind());
  json["maxTreads"] = disk.maxTreads();
  json["volumes"] = nlohmann::ordered_json::array();
  for (const auto& volume : volumesOf(disk)) json["volumes"].push_back(volume.absoluteString());
  return json;
}

}  // namespace

int DisksCommand::run(Console& console) const {
  std::string text;
  nlohmann::ordered_json json = {{"disks", nlohmann::ordered_json::array()}};
  for (const auto& disk : OVDiskInfo::allDiskInfos()) {
    text += textOf(*disk);
    json["disks"].push_back(jsonOf(*disk));
  }
  return console.writeResult(isJSON ? jsonLine(json) : text) ? 0 : 1;
}

}  // namespace Orvane
