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
  auto error = open();
  if (!error) takeOverSetAside();
  return error;
}

DurableFile::Failure DurableFile::replaceLost() {
  auto lost = std::move(connection_);
  const auto turn = takeTurn();
  const auto fail = [&](const PlatformError& error) {
    // Its rows may be nowhere else.
    connection_ = std::move(lost);
    return error;
  };
  if (!turn) return fail(turn.error());
  PrivateFiles& files = ports_.privateFiles;
  const auto there = files.identity(path_);
  Failure error;
  if (there == lost->file)
    error = moveAside("its journal or what it held was taken away");
  else if (lost->log && files.identity(logPath_) == lost->log)
    removeJournals();
  if (!error) error = open();
  if (error) return fail(*error);
  // Whoever has set the file aside takes its rows over, and what was written after that is done
  // again.
  const bool isSetAside = files.identity(path_ + pendingSuffix) == lost->file ||
                          files.identity(path_ + asideSuffix) == lost->file;
  if (there == lost->file || !isSetAside) {
    if (there != lost->file)
      say(there ? "was replaced" : "was removed or renamed, and is begun anew");
    error = takeOver(&lost->database, !there);
    if (error) return fail(*error);
  }
  // Two connections to one file would share what they know about its log.
  lost.reset();
  takeOverSetAside();
  return std::nullopt;
}

// The file goes first: without it nobody takes the journals for those of another.
DurableFile::Failure DurableFile::moveAside(const std::string& reason) {
  if (const auto failure = ports_.privateFiles.rename(path_, path_ + pendingSuffix))
    return PlatformError(failure);
  finishMovingAside();
  say("is set aside as " + path_ + asideSuffix + ": " + reason);
  return std::nullopt;
}

void DurableFile::finishMovingAside() {
  PrivateFiles& files = ports_.privateFiles;
  if (files.identity(path_) || !files.identity(path_ + pendingSuffix)) return;
  for (const char* suffix : journalSuffixes)
    static_cast<void>(files.rename(path_ + suffix, path_ + pendingSuffix + suffix));
}

// Journals whose file is gone would be taken for those of the file that comes in its place. Those
// who have them open keep what is in them.
void DurableFile::removeJournals() {
  for (const char* suffix : journalSuffixes)
    static_cast<void>(ports_.privateFiles.remove(path_ + suffix));
}

// What fails here is tried again when the file is opened next.
void DurableFile::takeOverSetAside() {
  PrivateFiles& files = ports_.privateFiles;
  const std::string pending = path_ + pendingSuffix;
  if (!files.identity(pending)) return;
  const auto resolved = files.prepare(pending);
  if (!resolved) return;
  {
    auto from = SQLiteDatabase::open(*resolved, SQLiteDatabase::Access::existing);
    // Makes the library read a file that is shorter than it says.
    if (from) static_cast<void>(from->execute("PRAGMA writable_schema = ON"));
    if (takeOver(from ? &*from : nullptr, true)) return;
  }
  for (const char* suffix : journalSuffixes) {
    static_cast<void>(files.remove(path_ + asideSuffix + suffix));
    static_cast<void>(files.rename(pending + suffix, path_ + asideSuffix + suffix));
  }
  static_cast<void>(files.rename(pending, path_ + asideSuffix));
}

DurableFile::Failure DurableFile::takeOver(SQLiteDatabase* from, bool isCounted) {
  return connection_->database.transaction("BEGIN IMMEDIATE", [&](SQLiteDatabase& to) -> Failure {
    if (from)
      if (auto error = salvage(*from, to, format_.tables)) return error;
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
