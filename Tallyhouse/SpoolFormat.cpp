// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/SpoolFormat.h>

namespace Tallyhouse {

using Varnel::Platform::DurableFormat;

// The text comes last, so that a search passes over it. An index of the UUIDs would make an
// insertion half as dear again.
const DurableFormat& spoolFormat() {
  static const DurableFormat format{
      .subject = "events",
      .applicationID = 0x54414C59,
      .version = {.major = 1, .minor = 0},
      .schema =
          "CREATE TABLE event(id INTEGER PRIMARY KEY, date INTEGER NOT NULL,"
          " refusals INTEGER NOT NULL DEFAULT 0, refused_at INTEGER NOT NULL DEFAULT 0,"
          " uuid TEXT NOT NULL, hit TEXT NOT NULL);"
          "CREATE INDEX refused ON event(refused_at) WHERE refusals > 0;"
          // Its row is made by the first who has something to say.
          "CREATE TABLE state(id INTEGER PRIMARY KEY CHECK (id = 1),"
          " epoch INTEGER NOT NULL DEFAULT 0,"
          " dropped INTEGER NOT NULL DEFAULT 0,"       // Events pushed out or given up.
          " lost_through INTEGER NOT NULL DEFAULT 0,"  // The last of those pushed out.
          " server TEXT NOT NULL DEFAULT '',"          // Whom the next three are about.
          " not_before INTEGER NOT NULL DEFAULT 0,"    // The end of the pause; 0: none.
          " obstacle INTEGER NOT NULL DEFAULT 0,"      // Why the last attempts failed,
          " failures INTEGER NOT NULL DEFAULT 0);",    // and how many in a row.
      .migrations = {},
      .journal = DurableFormat::Journal::writeAhead,
      .synchronisation = DurableFormat::Synchronisation::survivesKill,
      .tables = {{.name = "event"}, {.name = "state"}}};
  return format;
}

}  // namespace Tallyhouse
