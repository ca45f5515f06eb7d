// SPDX-License-Identifier: MIT
#include <Varnel/DiskWatch/DiskAccessNote.h>

#include <algorithm>
#include <utility>

#include <Varnel/Basalt/JSON.h>

namespace Varnel {
namespace {

using Basalt::JSON;
using Basalt::JSONError;
using Platform::PropertyDictionary;
using Platform::PropertyList;

// So that every note fits on the board.
constexpr std::size_t maxPlaces = 48;
constexpr std::size_t maxDisks = 24;
constexpr std::size_t maxTextSize = 80;

std::string shortened(std::string text) {
  text.resize(std::min(text.size(), maxTextSize));
  return text;
}

DiskAccessNote::Waiters counts(const DiskAccessSnapshot::Waiters& waiters) {
  DiskAccessNote::Waiters counts{};
  std::transform(waiters.begin(), waiters.end(), counts.begin(),
                 [](std::size_t count) { return static_cast<std::int64_t>(count); });
  return counts;
}

PropertyList jsonOf(const DiskAccessNote::Waiters& waiters) {
  return {waiters.begin(), waiters.end()};
}

// Reading. What does not fit throws.

template <typename Type>
const Type& valueOf(const PropertyDictionary& object, std::string_view key) {
  const Type* value = Platform::findAs<Type>(object, key);
  if (!value) throw JSONError::missingValue("DiskAccessNote", std::string(key));
  return *value;
}

std::int64_t countFrom(const JSON* json) {
  const auto* count = json ? json->as<std::int64_t>() : nullptr;
  if (!count || *count < 0) throw JSONError::withMessage("no count");
  return *count;
}

// Whole numbers of seconds are written as such.
double secondsFrom(const JSON* json) {
  const auto* fraction = json ? json->as<double>() : nullptr;
  const auto* whole = json ? json->as<std::int64_t>() : nullptr;
  const double seconds = fraction ? *fraction : whole ? static_cast<double>(*whole) : -1;
  if (!(seconds >= 0)) throw JSONError::withMessage("no time");
  return seconds;
}

DiskAccessNote::Waiters waitersFrom(const PropertyList& list) {
  DiskAccessNote::Waiters waiters{};
  if (list.size() != waiters.size()) throw JSONError::withMessage("other classes");
  std::transform(list.begin(), list.end(), waiters.begin(),
                 [](const JSON& each) { return countFrom(&each); });
  return waiters;
}

const PropertyDictionary& objectFrom(const JSON& json) {
  const auto* object = json.as<PropertyDictionary>();
  if (!object) throw JSONError::withMessage("no object");
  return *object;
}

DiskAccessNote::Disk diskFrom(const JSON& json) {
  const PropertyDictionary& object = objectFrom(json);
  DiskAccessNote::Disk disk{
      .uniqueID = valueOf<std::string>(object, "uniqueID"),
      .volume = valueOf<std::string>(object, "volume"),
      .maxReaders = countFrom(Platform::find(object, "maxReaders")),
      .waiters = waitersFrom(valueOf<PropertyList>(object, "waiters")),
      .waitersForProcesses = waitersFrom(valueOf<PropertyList>(object, "waitersForProcesses"))};
  for (const JSON& each : valueOf<PropertyList>(object, "places")) {
    const PropertyDictionary& place = objectFrom(each);
    disk.places.push_back({.propose = valueOf<std::string>(place, "propose"),
                           .seconds = secondsFrom(Platform::find(place, "seconds"))});
  }
  return disk;
}

}  // namespace

DiskAccessNote::DiskAccessNote(std::string program_,
                               const std::vector<DiskAccessSnapshot>& snapshots,
                               DiskAccessSnapshot::Time now)
    : program(shortened(std::move(program_))) {
  std::size_t placeCount = 0;
  for (const DiskAccessSnapshot& snapshot : snapshots) {
    if (disks.size() == maxDisks) break;
    const auto& volumes = snapshot.disk->volumeURLs();
    Disk& disk = disks.emplace_back(
        Disk{.uniqueID = shortened(snapshot.disk->uniqueID().value_or("")),
             .volume = volumes && !volumes->empty() ? shortened(volumes->begin()->path()) : "",
             .maxReaders = snapshot.maxReaders,
             .waiters = counts(snapshot.waiters),
             .waitersForProcesses = counts(snapshot.waitersForProcesses)});
    for (const auto& place : snapshot.places) {
      if (++placeCount > maxPlaces) break;
      // One may have come after `now`.
      const std::chrono::duration<double> held = now - place.since;
      disk.places.push_back({shortened(place.propose), std::max(held.count(), 0.0)});
    }
  }
}

std::optional<DiskAccessNote> DiskAccessNote::fromText(std::string_view text) {
  try {
    const JSON json = Basalt::parseJSON(text);
    const PropertyDictionary& object = objectFrom(json);
    DiskAccessNote note;
    note.program = valueOf<std::string>(object, "program");
    for (const JSON& disk : valueOf<PropertyList>(object, "disks"))
      note.disks.push_back(diskFrom(disk));
    return note;
  } catch (const JSONError&) {
    return std::nullopt;
  }
}

std::string DiskAccessNote::text() const {
  PropertyList all;
  for (const Disk& disk : disks) {
    PropertyList places;
    for (const Place& place : disk.places)
      places.emplace_back(
          PropertyDictionary{{"propose", place.propose}, {"seconds", place.seconds}});
    all.emplace_back(PropertyDictionary{{"uniqueID", disk.uniqueID},
                                        {"volume", disk.volume},
                                        {"maxReaders", disk.maxReaders},
                                        {"places", std::move(places)},
                                        {"waiters", jsonOf(disk.waiters)},
                                        {"waitersForProcesses", jsonOf(disk.waitersForProcesses)}});
  }
  return Basalt::jsonText(PropertyDictionary{{"program", program}, {"disks", std::move(all)}});
}

}  // namespace Varnel
