// SPDX-License-Identifier: MIT
// What other processes tell of the disks that they read, and what is shown of it.
#include <algorithm>
#include <cmath>

#include <nlohmann/json.hpp>

#include <Fuzz/Fuzz.h>
#include <Varnel/DiskWatch/DiskAccessNote.h>
#include <orvane/LiveDisks.h>

using Varnel::DiskAccessNote;

static void fuzz(std::string_view input) {
  const Orvane::Notes notes = {{.process = 4711, .text = std::string(input)}};
  for (const char c : Orvane::textOfLiveDisks(notes))
    require(c == '\n' || (static_cast<unsigned char>(c) >= ' ' && c != '\x7f'));
  const std::string shown = Orvane::jsonOfLiveDisks(notes).dump();
  const auto note = DiskAccessNote::fromText(input);
  require(note.has_value() == (shown != "[]"));
  if (!note) return;
  require(DiskAccessNote::fromText(note->text()) == note);
  for (const DiskAccessNote::Disk& disk : note->disks) {
    require(disk.maxReaders >= 0);
    for (const auto& place : disk.places)
      require(std::isfinite(place.seconds) && place.seconds >= 0);
    for (const auto& waiters : {disk.waiters, disk.waitersForProcesses})
      require(std::ranges::all_of(waiters, [](std::int64_t count) { return count >= 0; }));
  }
}
