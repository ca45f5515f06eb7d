// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationStoreFile.h>

#include <sqlite3.h>

#include <chrono>
#include <fstream>
#include <utility>

#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

constexpr std::chrono::milliseconds patience{2000};
constexpr int resultCodeMask = 0xff;

bool isDamage(const PlatformError& error) {
  const long code = error.code() & resultCodeMask;
  return code == SQLITE_CORRUPT || code == SQLITE_NOTADB;
}

// Another process has kept the file locked for longer than we wait.
bool isBusy(const PlatformError& error) {
  return (error.code() & resultCodeMask) == SQLITE_BUSY;
}

// Only the user may read the notifications. That includes the library's temporary files beside the
// database.
void makeForUserAlone(const fs::path& file) {
  std::error_code ignored;
  if (!fs::exists(file.parent_path(), ignored)) {
    fs::create_directories(file.parent_path(), ignored);
    fs::permissions(file.parent_path(), fs::perms::owner_all, ignored);
  }
  if (!fs::exists(file, ignored)) std::ofstream(file, std::ios::app).flush();
  fs::permissions(file, fs::perms::owner_read | fs::perms::owner_write, ignored);
}

// Damage: the file is not a database, its pages do not fit, or its tables are not those of the
// schema.
std::optional<PlatformError> check(SQLiteDatabase& database, const std::string& schema) {
  const auto damaged = [](const std::string& message) {
    return PlatformError("SQLite", SQLITE_CORRUPT,
                         {{std::string(localizedDescriptionKey), message}});
  };
  // Besides damage proper, the library's plain error says that it does not understand the file.
  const auto judged = [&](const PlatformError& error) {
    return error.code() == SQLITE_ERROR ? damaged(error.localizedDescription()) : error;
  };
  auto verdict = database.prepare("PRAGMA quick_check(1)");
  if (!verdict) return judged(verdict.error());
  const auto step = verdict->step();
  if (!step) return judged(step.error());
  if (verdict->text(0) != "ok")
    return damaged(std::string(verdict->text(0).value_or("no verdict")));
  verdict->reset();
  if (const auto error = database.execute(schema)) return judged(*error);
  return std::nullopt;
}

std::optional<PlatformError> transaction(SQLiteDatabase& database,
                                         const NotificationStoreFile::Work& work) {
  if (auto error = database.execute("BEGIN IMMEDIATE")) return error;
  auto error = work(database);
  if (!error) error = database.execute("COMMIT");
  // This fails if the error has already ended the transaction.
  if (error) static_cast<void>(database.execute("ROLLBACK"));
  return error;
}

}  // namespace

NotificationStoreFile::NotificationStoreFile(fs::path file, std::string schema,
                                             SystemLog& systemLog)
    : file_(std::move(file)), schema_(std::move(schema)), systemLog_(systemLog) {}

bool NotificationStoreFile::read(const Work& work) {
  const auto error = attempt(work);
  if (error) report("Cannot read notifications", *error);
  return !error;
}

bool NotificationStoreFile::change(const Work& work) {
  const auto error = attempt([&](SQLiteDatabase& database) { return transaction(database, work); });
  if (error) report("Cannot keep notifications", *error);
  return !error;
}

std::optional<PlatformError> NotificationStoreFile::attempt(const Work& work) {
  if (auto error = ensureOpen()) return error;
  auto error = work(*database_);
  if (!error || !isDamage(*error)) return error;
  if (auto failure = setAside()) return failure;
  return work(*database_);
}

std::optional<PlatformError> NotificationStoreFile::open() {
  database_.reset();
  makeForUserAlone(file_);
  auto opened = SQLiteDatabase::open(file_.string(), SQLiteDatabase::Access::readWrite);
  if (!opened) return opened.error();
  opened->setBusyTimeout(patience);
  if (auto error = check(*opened, schema_)) return error;
  database_ = std::move(*opened);
  return std::nullopt;
}

std::optional<PlatformError> NotificationStoreFile::ensureOpen() {
  // Another process may have set the file aside, or the user removed it.
  if (database_ && !database_->hasMoved()) return std::nullopt;
  const auto error = open();
  if (!error) return std::nullopt;
  return isDamage(*error) ? setAside() : doWithout(*error);
}

std::optional<PlatformError> NotificationStoreFile::setAside() {
  // Another process may have done so meanwhile: then the file is sound again.
  auto error = open();
  if (!error) return std::nullopt;
  if (!isDamage(*error)) return doWithout(*error);
  fs::path aside = file_;
  aside += ".damaged";
  report("Set aside the damaged store of notifications as " + aside.string(), *error);
  std::error_code ignored;
  fs::rename(file_, aside, ignored);
  fs::path journal = file_;
  fs::remove(journal += "-journal", ignored);
  error = open();
  return error ? doWithout(*error) : std::nullopt;
}

std::optional<PlatformError> NotificationStoreFile::doWithout(const PlatformError& reason) {
  // The next attempt may find the file free.
  if (isBusy(reason)) return reason;
  report("Notifications are kept in memory alone", reason);
  database_ = std::move(*SQLiteDatabase::open(":memory:"));
  return database_->execute(schema_);
}

void NotificationStoreFile::report(const std::string& what, const PlatformError& error) const {
  systemLog_.write(what + ": " + error.localizedDescription());
}

}  // namespace Varnel::Platform
