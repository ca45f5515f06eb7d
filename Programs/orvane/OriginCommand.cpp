// SPDX-License-Identifier: MIT
#include <orvane/OriginCommand.h>

#include <algorithm>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <vector>

#include <fmt/chrono.h>

#include <Varnel/Provenance/KVDownloadSourceTracker.h>
#include <Varnel/Provenance/KVQuarantine.h>
#include <orvane/Console.h>
#include <orvane/FactList.h>

namespace Orvane {
namespace {

using Varnel::KVQuarantine;
using Varnel::KVQuarantineEntry;
using Text = std::optional<std::string>;

Text owned(KVQuarantineEntry::Text text) {
  return text ? Text(*text) : std::nullopt;
}

FactList factsOfThisProgram() {
  const auto tracker = Varnel::KVDownloadSourceTracker::sharedTracker();
  const auto entry = tracker->installSourceEntry();
  FactList facts;
  facts.add("database", "database", tracker->quarantine()->path());
  facts.add("eventIdentifier", "event", entry ? owned(entry->eventIdentifier()) : std::nullopt);
  facts.add("dataURL", "downloaded from", entry ? owned(entry->dataURLString()) : std::nullopt);
  return facts;
}

// The attribute has the time in hexadecimal seconds since 1970.
Text dateIn(const std::string& field) {
  std::uint32_t seconds = 0;
  const char* const end = field.data() + field.size();
  const auto [stop, status] = std::from_chars(field.data(), end, seconds, 16);
  if (field.empty() || status != std::errc() || stop != end) return field;
  return fmt::format("{:%Y-%m-%d %H:%M:%S} UTC",
                     std::chrono::sys_time<std::chrono::seconds>(std::chrono::seconds(seconds)));
}

Text dataURLOf(const Text& eventIdentifier) {
  const auto entries = KVQuarantine::systemQuarantine()->entries();
  const auto found = std::find_if(entries.begin(), entries.end(), [&](const auto& entry) {
    return entry.eventIdentifier() == eventIdentifier;
  });
  return found == entries.end() ? std::nullopt : owned(found->dataURLString());
}

FactList factsOfFile(const std::string& file) {
  const auto fields = KVQuarantine::quarantineXATTRsForPath(file);
  const auto field = [&](std::size_t index) -> Text {
    if (!fields || fields->size() <= index) return std::nullopt;
    return (*fields)[index];
  };
  const Text time = field(1);
  const Text event = field(3);
  FactList facts;
  facts.add("file", "file", file);
  facts.add("flags", "flags", field(0));
  facts.add("date", "downloaded at", time ? dateIn(*time) : std::nullopt);
  facts.add("agentName", "downloaded by", field(2));
  facts.add("eventIdentifier", "event", event);
  facts.add("dataURL", "downloaded from", event ? dataURLOf(event) : std::nullopt);
  return facts;
}

}  // namespace

int OriginCommand::run(Console& console) const {
  std::error_code failed;
  if (!file.empty() && !std::filesystem::exists(file, failed)) {
    console.complain(
        file + ": " +
        (failed ? failed : std::make_error_code(std::errc::no_such_file_or_directory)).message());
    return 1;
  }
  const FactList facts = file.empty() ? factsOfThisProgram() : factsOfFile(file);
  const auto form = isJSON ? FactList::Form::json : FactList::Form::lines;
  return console.writeResult(facts.text(form)) ? 0 : 1;
}

}  // namespace Orvane
