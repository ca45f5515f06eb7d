// SPDX-License-Identifier: MIT
#include <Removal/RemovalJournal.h>

#include <filesystem>
#include <tuple>

#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Values/UUID.h>

// A removal is known in the file by a unique identifier, so that what is inserted again, when the
// file had to be mended meanwhile, is inserted once. Its number is for people.
namespace Orvane {
namespace {

using Failure = RemovalJournal::Failure;
using Varnel::Platform::Date;
using Varnel::Platform::DurableFormat;
using Varnel::Platform::FileState;
using Varnel::Platform::Migrating;
using Varnel::Platform::Result;
using Varnel::Platform::SQLiteDatabase;
using Varnel::Platform::SQLiteStatement;
using Varnel::Platform::TrashedFile;

DurableFormat format() {
  return {.subject = "removals",
          .applicationID = 0x4f76526d,  // "OvRm"
          .version = {.major = 1, .minor = 0},
          .schema = R"(
            CREATE TABLE removals(
              number INTEGER PRIMARY KEY AUTOINCREMENT,
              identifier TEXT NOT NULL UNIQUE,
              began INTEGER NOT NULL);
            CREATE TABLE files(
              number INTEGER PRIMARY KEY AUTOINCREMENT,
              removal TEXT NOT NULL,
              path TEXT NOT NULL,
              folder TEXT NOT NULL,
              name TEXT NOT NULL,
              device INTEGER NOT NULL,
              inode INTEGER NOT NULL,
              size INTEGER NOT NULL,
              modified INTEGER NOT NULL,
              nanoseconds INTEGER NOT NULL,
              state INTEGER NOT NULL,
              UNIQUE(removal, path)))",
          .migrations = {},
          .journal = DurableFormat::Journal::writeAhead,
          .synchronisation = DurableFormat::Synchronisation::survivesPowerLoss,
          .tables = {{.name = "removals", .ownNumber = "number"},
                     {.name = "files", .ownNumber = "number"}}};
}

std::int64_t numberOf(RemovalJournal::State state) {
  return static_cast<std::int64_t>(state);
}

// What somebody else's program wrote may be any number.
RemovalJournal::State stateOf(std::int64_t number) {
  using enum RemovalJournal::State;
  return number == numberOf(restored) ? restored : number == numberOf(lost) ? lost : moved;
}

// The file keeps signed numbers, without a change to the bits.
std::int64_t kept(std::uint64_t number) {
  return static_cast<std::int64_t>(number);
}

RemovalJournal::Entry entryIn(SQLiteStatement& row) {
  RemovalJournal::Entry entry;
  TrashedFile& file = entry.file;
  std::int64_t device = 0, inode = 0, size = 0, nanoseconds = 0, state = 0;
  row.read(std::tie(file.path, file.folder, file.name, device, inode, size, file.state.modified,
                    nanoseconds, state));
  file.state.device = static_cast<std::uint64_t>(device);
  file.state.inode = static_cast<std::uint64_t>(inode);
  file.state.size = static_cast<std::uint64_t>(size);
  file.state.nanoseconds = static_cast<std::int32_t>(nanoseconds);
  entry.state = stateOf(state);
  return entry;
}

RemovalRecord recordIn(SQLiteStatement& row) {
  RemovalRecord record;
  std::int64_t files = 0, bytes = 0, restored = 0, lost = 0;
  row.read(std::tie(record.identifier, record.number, record.began, files, bytes, restored, lost));
  record.files = static_cast<std::uint64_t>(files);
  record.bytes = static_cast<std::uint64_t>(bytes);
  record.restored = static_cast<std::uint64_t>(restored);
  record.lost = static_cast<std::uint64_t>(lost);
  return record;
}

}  // namespace

std::string RemovalJournal::productPath() {
  const std::filesystem::path spool = Varnel::ApplicationData::analyticsSpoolPath();
  return spool.parent_path() / "removals.sqlite";
}

RemovalJournal::RemovalJournal(Varnel::Platform::DurableFile::Ports ports, const std::string& path)
    : ports_(ports), path_(path), file_(ports, path, format(), Migrating::allowed) {}

Result<RemovalJournal::Lock> RemovalJournal::lock() {
  return ports_.privateFiles.tryLock(path_ + ".removing");
}

Result<RemovalRecord> RemovalJournal::begin(Date now) {
  RemovalRecord record{.identifier = Varnel::Platform::randomUUIDString(), .began = now};
  auto error = file_.change([&](SQLiteDatabase& database) -> Failure {
    if (auto failure = database.run("DELETE FROM removals WHERE identifier NOT IN "
                                    "(SELECT removal FROM files WHERE state = ?)",
                                    numberOf(State::moved)))
      return failure;
    if (auto failure = database.run("DELETE FROM files WHERE removal NOT IN "
                                    "(SELECT identifier FROM removals)"))
      return failure;
    return database.run("INSERT OR IGNORE INTO removals(identifier, began) VALUES(?, ?)",
                        record.identifier, record.began);
  });
  if (!error)
    error = file_.read([&](SQLiteDatabase& database) {
      return database.row("SELECT number FROM removals WHERE identifier = ?",
                          std::tie(record.number), record.identifier);
    });
  if (error) return *error;
  return record;
}

Failure RemovalJournal::note(const RemovalRecord& removal, const TrashedFile& file) {
  const FileState& state = file.state;
  return file_.changeByOneStatement([&](SQLiteDatabase& database) {
    return database.run(
        "INSERT OR REPLACE INTO files(removal, path, folder, name, device, inode, size, modified, "
        "nanoseconds, state) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?)",
        removal.identifier, file.path, file.folder, file.name, kept(state.device),
        kept(state.inode), kept(state.size), state.modified, std::int64_t{state.nanoseconds},
        numberOf(State::moved));
  });
}

Failure RemovalJournal::forget(const RemovalRecord& removal, const std::string& path) {
  return file_.changeByOneStatement([&](SQLiteDatabase& database) {
    return database.run("DELETE FROM files WHERE removal = ? AND path = ?", removal.identifier,
                        path);
  });
}

Result<std::vector<RemovalRecord>> RemovalJournal::removals() {
  std::vector<RemovalRecord> found;
  if (!file_.isThere()) return found;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    found.clear();
    // A sum of whole numbers fails where it does not fit; one odd row would hide all removals.
    return database.each(
        "SELECT identifier, removals.number, began, count(*), total(size), sum(state = ?), "
        "sum(state = ?) FROM removals JOIN files ON removal = identifier "
        "GROUP BY identifier ORDER BY removals.number DESC",
        [&](SQLiteStatement& row) { found.push_back(recordIn(row)); }, numberOf(State::restored),
        numberOf(State::lost));
  });
  if (error) return *error;
  return found;
}

Result<std::vector<RemovalJournal::Entry>> RemovalJournal::entries(const RemovalRecord& removal) {
  std::vector<Entry> found;
  const auto error = file_.read([&](SQLiteDatabase& database) {
    found.clear();
    return database.each(
        "SELECT path, folder, name, device, inode, size, modified, nanoseconds, state "
        "FROM files WHERE removal = ? ORDER BY number",
        [&](SQLiteStatement& row) { found.push_back(entryIn(row)); }, removal.identifier);
  });
  if (error) return *error;
  return found;
}

Failure RemovalJournal::setState(const RemovalRecord& removal, const std::string& path,
                                 State state) {
  return file_.changeByOneStatement([&](SQLiteDatabase& database) {
    return database.run("UPDATE files SET state = ? WHERE removal = ? AND path = ?",
                        numberOf(state), removal.identifier, path);
  });
}

}  // namespace Orvane
