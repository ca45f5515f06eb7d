// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/DurableFile.h>

#include <filesystem>
#include <utility>

#include <Varnel/Platform/Concurrency/ForkedChild.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/SQLite/DurableConnection.h>
#include <fmt/format.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

// A file that is taken away this often within one operation is beyond help.
constexpr int maxRounds = 4;
// For how long a user who does not look each time trusts that the files are in their places.
constexpr auto maxUnlooked = std::chrono::milliseconds(1);
// The log is moved into the file when it has this many pages, unless somebody does so before.
constexpr int maxLoggedPages = 8000;

// An error that another attempt cannot mend, and that is worth a line in the log.
bool isWorthALine(SQLiteFailure meaning) {
  return meaning != SQLiteFailure::busy && meaning != SQLiteFailure::damaged;
}

// Whether the connection keeps a write-ahead log.
bool keepsLog(SQLiteDatabase& database) {
  std::string mode;
  return !database.row("PRAGMA journal_mode", std::tie(mode)) && mode == "wal";
}

bool isOfAnotherFormat(const std::optional<PlatformError>& error) {
  if (!error) return false;
  const SQLiteFailure meaning = meaningOf(*error);
  return meaning == SQLiteFailure::newer || meaning == SQLiteFailure::older ||
         meaning == SQLiteFailure::refused;
}

bool isDamage(const std::optional<PlatformError>& error) {
  return error && meaningOf(*error) == SQLiteFailure::damaged;
}

}  // namespace

DurableFile::DurableFile(Ports ports, const std::string& path, DurableFormat format,
                         Migrating migrating)
    : ports_(ports),
      path_(fs::absolute(path).string()),
      logPath_(path_ + "-wal"),
      indexPath_(path_ + "-shm"),
      format_(std::move(format)),
      migrating_(migrating) {}

DurableFile::~DurableFile() {
  if (isFromBeforeFork()) static_cast<void>(connection_.release());
}

DurableFile::Failure DurableFile::read(const Work& work) {
  return attempt(Looking::eachTime, [&](SQLiteDatabase& database) {
    return database.transaction("BEGIN", ofThisFormat(work));
  });
}

DurableFile::Failure DurableFile::change(const Work& work) {
  // What could only be read may be writable by now.
  if (connection_ && !isFromBeforeFork() && connection_->database.isReadOnly()) connection_.reset();
  return attempt(Looking::eachTime, [&](SQLiteDatabase& database) {
    return database.transaction("BEGIN IMMEDIATE", [&](SQLiteDatabase&) -> Failure {
      if (auto error = ofThisFormat(work)(database)) return error;
      // What is committed to a lost file may be found later, though it could not be carried over.
      if (isLost()) return fileError(SQLiteFailure::busy, path_ + " was taken away meanwhile");
      return std::nullopt;
    });
  });
}

DurableFile::Failure DurableFile::changeByOneStatement(const Work& work, Looking looking) {
  return attempt(looking, [&](SQLiteDatabase& database) {
    auto error = work(database);
    // The tables may be those of a later version by now.
    if (error && meaningOf(*error) == SQLiteFailure::other)
      if (auto objection = judgeFormat(database, format_, Migrating::never)) return objection;
    return error;
  });
}

// Another process may have migrated the file since it was opened.
DurableFile::Work DurableFile::ofThisFormat(const Work& work) const {
  return [&](SQLiteDatabase& database) {
    auto objection = judgeFormat(database, format_, Migrating::never);
    return objection ? objection : work(database);
  };
}

void DurableFile::checkpoint() {
  loggedPages_ = 0;
  if (!connection_ || isFromBeforeFork() || isLost()) return;
  deadline_.restart();
  static_cast<void>(connection_->database.execute("PRAGMA wal_checkpoint(PASSIVE)"));
}

std::int64_t DurableFile::damageCount() {
  std::int64_t count = 0;
  static_cast<void>(read([&](SQLiteDatabase& database) {
    return database.row("SELECT damages FROM durable_file", std::tie(count));
  }));
  return count;
}

bool DurableFile::isThere() const {
  bool isThere = connection_ != nullptr;
  for (const char* suffix : {"", "-wal", "-journal", turnSuffix, pendingSuffix})
    isThere = isThere || ports_.privateFiles.identity(path_ + suffix);
  return isThere;
}

DurableFile::Failure DurableFile::attempt(Looking looking, const Work& operation) {
  if (isFromBeforeFork()) return fileError(SQLiteFailure::refused, path_ + " is the parent's");
  deadline_.restart();
  Failure error;
  for (int round = 0; round < maxRounds; ++round) {
    if ((error = ensureOpen())) return said(*error);
    error = operation(connection_->database);
    const bool looks = error || looking == Looking::eachTime || isTimeToLook();
    if (looks && isLost()) {
      error = replaceLost();
    } else if (isDamage(error)) {
      error = setAside(*error);
    } else {
      if (loggedPages_ >= maxLoggedPages) checkpoint();
      // What can only be read now may be written later, by a connection of that time.
      if (connection_->database.isReadOnly() || isOfAnotherFormat(error)) connection_.reset();
      return error ? said(*error) : error;
    }
    if (error) return said(*error);
  }
  return said(fileError(SQLiteFailure::other, path_ + " is taken away again and again"));
}

bool DurableFile::isFromBeforeFork() const {
  return connection_ && connection_->forksBefore != forksSoFar();
}

// Without a log, what is written into a file that was emptied cannot be carried over.
bool DurableFile::isTimeToLook() const {
  return !connection_->log ||
         std::chrono::steady_clock::now() - connection_->lookedAt >= maxUnlooked;
}

// Whether the path no longer leads to what the connection writes. Only the path can tell: when a
// folder above it is renamed, nothing changes at the file.
bool DurableFile::isLost() {
  PrivateFiles& files = ports_.privateFiles;
  connection_->lookedAt = std::chrono::steady_clock::now();
  const auto file = files.identity(path_);
  if (!file || file->isEmpty || *file != connection_->file) return true;
  return (connection_->log && files.identity(logPath_) != connection_->log) ||
         (connection_->index && files.identity(indexPath_) != connection_->index);
}

DurableFile::Failure DurableFile::ensureOpen() {
  if (connection_) return std::nullopt;
  if (const auto turn = takeTurn(); !turn) {
    // Where nothing can be locked nothing can be changed, by anybody, but perhaps read.
    if (meaningOf(turn.error()) != SQLiteFailure::readOnly) return turn.error();
    const bool isWhole = !ports_.privateFiles.identity(path_ + pendingSuffix);
    if (!isWhole || !ports_.privateFiles.identity(path_)) return turn.error();
    if (auto error = open()) return error;
  } else {
    auto error = openWhole();
    if (isDamage(error)) {
      connection_.reset();
      error = moveAside(error->localizedDescription());
      if (!error) error = openWhole();
    }
    if (error) return error;
  }
  // A large file takes its time, which others need not wait for.
  const auto error = check();
  if (isDamage(error)) return setAside(*error);
  if (error) connection_.reset();
  return error;
}

// Only one who holds the lock may open, set aside or replace the file.
Result<std::unique_ptr<FileLock>> DurableFile::takeTurn() {
  while (true) {
    auto lock = ports_.privateFiles.tryLock(path_ + turnSuffix);
    if (!lock || *lock) return lock;
    if (!deadline_.pause())
      return fileError(SQLiteFailure::busy,
                       path_ + " is being opened or mended by another process");
  }
}

DurableFile::Failure DurableFile::openWhole() {
  auto error = open();
  return error ? error : takeOverSetAside();
}

DurableFile::Failure DurableFile::open() {
  finishMovingAside();
  const auto path = ports_.privateFiles.prepare(path_);
  if (!path) return path.error();
  const auto file = ports_.privateFiles.identity(path_);
  const bool isNew = file && file->isEmpty;
  if (isNew) removeJournals();
  auto database = SQLiteDatabase::open(*path, SQLiteDatabase::Access::existing);
  if (!database) return database.error();
  const bool isReadOnly = database->isReadOnly();
  const Migrating migrating = isReadOnly ? Migrating::never : migrating_;
  database->waitWithin(deadline_);
  auto error = judgeFormat(*database, format_, migrating);
  if (error &&
      (meaningOf(*error) == SQLiteFailure::readOnly || meaningOf(*error) == SQLiteFailure::other)) {
    // A write-ahead log needs files beside it, even for reading. Without a log the file is whole.
    const auto log = ports_.privateFiles.identity(logPath_);
    if (log && !log->isEmpty) return error;
    database = SQLiteDatabase::open(*path, SQLiteDatabase::Access::immutable);
    if (!database) return database.error();
    error = judgeFormat(*database, format_, migrating);
  }
  // Others wait meanwhile, and the first change brings all of a new file to the disk.
  if (!error && isNew) error = database->execute("PRAGMA synchronous = OFF");
  if (!error && !database->isReadOnly()) error = setUp(*database, *path);
  if (!error) error = applyFormat(*database, format_, migrating);
  const bool isFull = format_.synchronisation == DurableFormat::Synchronisation::survivesPowerLoss;
  if (!error)
    error = database->execute(isFull ? "PRAGMA synchronous = FULL" : "PRAGMA synchronous = NORMAL");
  if (error) return error;
  connection_ = std::make_unique<Connection>(std::move(*database), forksSoFar());
  if (noteFiles()) return std::nullopt;
  connection_.reset();
  return fileError(SQLiteFailure::busy, path_ + " was taken away while it was opened");
}

bool DurableFile::noteFiles() {
  PrivateFiles& files = ports_.privateFiles;
  Connection& open = *connection_;
  const auto file = files.identity(path_);
  if (!file || open.database.hasMoved()) return false;
  open.file = *file;
  if (open.database.isReadOnly() || !keepsLog(open.database)) return true;
  open.log = files.identity(logPath_);
  open.index = files.identity(indexPath_);
  return !isLost();
}

DurableFile::Failure DurableFile::setUp(SQLiteDatabase& database, const std::string& path) {
  if (const auto failure = ports_.privateFiles.protect(path)) return PlatformError(failure);
  if (format_.journal == DurableFormat::Journal::writeAhead) {
    const auto error = database.execute("PRAGMA journal_mode = WAL");
    if (error && meaningOf(*error) != SQLiteFailure::other) return error;
  }
  loggedPages_ = 0;
  database.countLoggedPages(loggedPages_);
  // A journal that is emptied, not removed, is found again by no name but its own.
  if (!keepsLog(database))
    if (auto error = database.execute("PRAGMA journal_mode = TRUNCATE")) return error;
  return database.execute("PRAGMA journal_size_limit = 1048576");
}

DurableFile::Failure DurableFile::check() {
  std::string verdict = "no verdict";
  if (auto error = connection_->database.row("PRAGMA quick_check(1)", std::tie(verdict)))
    return error;
  if (verdict == "ok") return std::nullopt;
  return fileError(SQLiteFailure::damaged, verdict);
}

PlatformError DurableFile::said(const PlatformError& error) {
  if (isWorthALine(meaningOf(error)) && said_.insert(meaningOf(error)).second)
    say("cannot be used: " + error.localizedDescription());
  return error;
}

void DurableFile::say(const std::string& what) const {
  ports_.systemLog.write(fmt::format("The file of {} {} {}", format_.subject, path_, what));
}

}  // namespace Varnel::Platform
