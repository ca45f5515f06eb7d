// SPDX-License-Identifier: MIT
// How a durable file that was damaged, or taken away, is set aside and begun anew.
#include <array>
#include <utility>

#include <Varnel/Platform/SQLite/DurableConnection.h>
#include <Varnel/Platform/SQLite/DurableFile.h>
#include <Varnel/Platform/SQLite/Salvage.h>

namespace Varnel::Platform {

// A file that has lost its journal is set aside as well. A new one has another identity, so that
// all other connections notice, and shares nothing with what they still have in memory.
//
// Each connection whose file was taken away takes over what it finds there. The new file notes the
// name of the other one, so that rows which were removed since do not come back. Where the other
// one can still be written it is emptied and gets another name: what is found there later is new.

namespace {

constexpr std::array<const char*, 3> journalSuffixes{"-wal", "-shm", "-journal"};

}  // namespace

DurableFile::Failure DurableFile::setAside(const PlatformError& damage) {
  const auto damaged = std::move(connection_);
  const auto turn = takeTurn();
  if (!turn) return meaningOf(turn.error()) == SQLiteFailure::readOnly ? damage : turn.error();
  // Another process may have done so meanwhile.
  if (ports_.privateFiles.identity(path_) == damaged->file)
    if (auto error = moveAside(damage.localizedDescription())) return error;
  return openWhole();
}

DurableFile::Failure DurableFile::replaceLost() {
  auto lost = std::move(connection_);
  const auto fail = [&](const PlatformError& error) {
    // Its rows may be nowhere else.
    connection_ = std::move(lost);
    connection_->lookedAt = {};
    return error;
  };
  const auto turn = takeTurn();
  if (!turn) return fail(turn.error());
  PrivateFiles& files = ports_.privateFiles;
  const auto there = files.identity(path_);
  const bool isHere = there == lost->file;
  Failure error;
  if (isHere)
    error = moveAside("its journal or what it held was taken away");
  else if (lost->log && files.identity(logPath_) == lost->log)
    removeJournals();
  if (!error) error = open();
  if (!error) error = takeOverLost(lost->database, isHere || !there);
  if (error) return fail(*error);
  const bool isPending = files.identity(path_ + pendingSuffix) == lost->file;
  const bool isSetAside = isPending || files.identity(path_ + asideSuffix) == lost->file;
  if (!isSetAside) say(there ? "was replaced" : "was removed or renamed, and is begun anew");
  // Two connections to one file would share what they know about its log.
  lost.reset();
  if (!isPending) return takeOverSetAside();
  if ((error = putAway(path_ + pendingSuffix))) connection_.reset();
  return error;
}

// The file goes first: without it nobody takes the journals for those of another.
DurableFile::Failure DurableFile::moveAside(const std::string& reason) {
  const std::string pending = path_ + pendingSuffix;
  if (ports_.privateFiles.identity(pending)) {
    // Nothing was kept in this file yet, but perhaps in the one that waits there.
    if (auto error = putAway(path_)) return error;
  } else {
    if (const auto failure = ports_.privateFiles.rename(path_, pending))
      return PlatformError(failure);
    finishMovingAside();
  }
  say("is set aside, and a new one is begun: " + reason);
  return std::nullopt;
}

void DurableFile::finishMovingAside() {
  PrivateFiles& files = ports_.privateFiles;
  const std::string pending = path_ + pendingSuffix;
  if (files.identity(path_) || !files.identity(pending)) return;
  for (const char* suffix : journalSuffixes)
    if (!files.identity(pending + suffix))
      static_cast<void>(files.rename(path_ + suffix, pending + suffix));
}

// Journals whose file is gone would be taken for those of the file that comes in its place. Those
// who have them open keep what is in them.
void DurableFile::removeJournals() {
  for (const char* suffix : journalSuffixes)
    static_cast<void>(ports_.privateFiles.remove(path_ + suffix));
}

// Without the rows that were set aside the new file would be taken for all there is.
DurableFile::Failure DurableFile::takeOverSetAside() {
  PrivateFiles& files = ports_.privateFiles;
  const std::string pending = path_ + pendingSuffix;
  if (!files.identity(pending)) return std::nullopt;
  const auto fail = [&](const PlatformError& error) {
    connection_.reset();
    return error;
  };
  const auto resolved = files.prepare(pending);
  if (!resolved) return fail(resolved.error());
  {
    auto from = SQLiteDatabase::open(*resolved, SQLiteDatabase::Access::existing);
    if (!from) return fail(from.error());
    from->waitWithin(deadline_);
    if (auto error = takeOver(*from, true)) return fail(*error);
  }
  const auto error = putAway(pending);
  return error ? fail(*error) : error;
}

// Keeps a file that is not needed any more for a look at it, where that can be.
DurableFile::Failure DurableFile::putAway(const std::string& file) {
  PrivateFiles& files = ports_.privateFiles;
  for (const char* suffix : journalSuffixes) {
    static_cast<void>(files.remove(path_ + asideSuffix + suffix));
    static_cast<void>(files.rename(file + suffix, path_ + asideSuffix + suffix));
    static_cast<void>(files.remove(file + suffix));
  }
  if (!files.rename(file, path_ + asideSuffix)) return std::nullopt;
  const auto failure = files.remove(file);
  return failure ? Failure(PlatformError(failure)) : std::nullopt;
}

// Where the lost file can be written, nobody else writes there meanwhile.
DurableFile::Failure DurableFile::takeOverLost(SQLiteDatabase& lost, bool isCounted) {
  Failure error;
  bool isTried = false;
  const auto obstacle = lost.transaction("BEGIN IMMEDIATE", [&](SQLiteDatabase&) -> Failure {
    isTried = true;
    if ((error = takeOver(lost, isCounted))) return error;
    for (const SavedTable& table : format_.tables)
      if (auto failure = lost.execute("DELETE FROM " + table.name)) return failure;
    return lost.execute("UPDATE durable_file SET rowid = random()");
  });
  if (isTried) return error;
  return meaningOf(*obstacle) == SQLiteFailure::busy ? obstacle : takeOver(lost, isCounted);
}

DurableFile::Failure DurableFile::takeOver(SQLiteDatabase& from, bool isCounted) {
  // Makes the library read a file that is shorter than it says.
  static_cast<void>(from.execute("PRAGMA writable_schema = ON"));
  // A file without a name that can be read is taken over each time.
  std::optional<std::int64_t> name;
  static_cast<void>(from.row("SELECT rowid FROM durable_file WHERE rowid <> 1", std::tie(name)));
  return connection_->database.transaction("BEGIN IMMEDIATE", [&](SQLiteDatabase& to) -> Failure {
    if (auto error = to.execute("CREATE TABLE IF NOT EXISTS durable_predecessor"
                                "(name INTEGER PRIMARY KEY)"))
      return error;
    if (name) {
      if (auto error = to.run("INSERT OR IGNORE INTO durable_predecessor VALUES(?)", name))
        return error;
      if (to.changedRows() == 0) return std::nullopt;
    }
    if (auto error = salvage(from, to, format_.tables)) return error;
    if (!isCounted) return std::nullopt;
    return to.execute("UPDATE durable_file SET damages = damages + 1");
  });
}

void DurableFile::removeSetAside() {
  for (const char* aside : {pendingSuffix, asideSuffix}) {
    static_cast<void>(ports_.privateFiles.remove(path_ + aside));
    for (const char* suffix : journalSuffixes)
      static_cast<void>(ports_.privateFiles.remove(path_ + aside + suffix));
  }
}

}  // namespace Varnel::Platform
