// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/SQLite/DurableFormat.h>
#include <Varnel/Platform/SQLite/LockDeadline.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>

namespace Varnel::Platform {

class SystemLog;

/// A database file under which promises lie: what a successful change has written is found again,
/// whatever happens to the process, and as far as possible whatever happens to the file.
///
///     DurableFile file({files, systemLog}, path, format, Migrating::allowed);
///     auto error = file.change([&](SQLiteDatabase& database) {
///       return database.run("INSERT OR IGNORE INTO note(uuid, text) VALUES(?, ?)", uuid, text);
///     });
///     if (error) tryLater(meaningOf(*error));
///
/// A work is done again when the file turns out to be damaged, or to have been moved, removed,
/// emptied or replaced, together with its journal or alone, even if that happened while it was
/// being done. So it must be repeatable: rows have unique keys and are inserted OR IGNORE or OR
/// REPLACE, and what it finds is built anew each time.
///
/// A damaged file is set aside (".damaged" behind its name) by one process alone, and a new one
/// begun, which takes over every row that can still be read; so it does from a connection whose
/// file was taken away. Both are said in the system's log and counted. Until the rows are taken
/// over, for want of room perhaps, every operation fails. With a write-ahead log, rows that were
/// taken over from a file that was moved are removed from it. A file that is not the user's own or
/// of a later format is left alone; that is said once by each object.
///
/// No operation waits longer than `maxLockWait` for the locks of others, all its waits together;
/// then it fails as busy. Nothing is kept in memory: what has failed is not done later. The file is
/// opened at the first operation. A file or folder that can only be read can be read from.
///
/// One thread at a time; several objects and processes may share a file. After a fork only the
/// parent may go on; in the child every operation fails as refused.
class DurableFile final {
 public:
  static constexpr std::chrono::milliseconds maxLockWait{20};

  struct Ports {
    PrivateFiles& privateFiles;
    SystemLog& systemLog;
  };

  /// Returns the error in its way, or none.
  using Work = std::function<std::optional<PlatformError>(SQLiteDatabase&)>;

  DurableFile(Ports ports, const std::string& path, DurableFormat format, Migrating migrating);
  DurableFile(const DurableFile&) = delete;
  DurableFile& operator=(const DurableFile&) = delete;
  ~DurableFile();

  /// Does a work that only reads, on one state of the file.
  [[nodiscard]] std::optional<PlatformError> read(const Work& work);

  /// Does the work wholly or not at all, and alone among all who share the file. When it fails
  /// nothing has changed, but for one case: if the file is taken away during the commit itself and
  /// cannot be replaced at once, the change goes into the next file if this object lives to see it.
  [[nodiscard]] std::optional<PlatformError> change(const Work& work);

  /// How often the file is looked at, whether it is still in its place.
  enum class Looking {
    eachTime,
    /// For less. What was written into a file that had been taken away within the last millisecond
    /// is carried over by the next operation that looks, not by this one: the last one of all
    /// should be a `read`.
    eachMillisecond
  };

  /// Does a work that runs one statement: the same for less. When it fails for want of a file in
  /// the place of one that was taken away, the change may still go into that one later.
  [[nodiscard]] std::optional<PlatformError> changeByOneStatement(
      const Work& work, Looking looking = Looking::eachTime);

  /// Moves the write-ahead log into the file. Takes as long as the disk does, and is done now and
  /// then by changes, too.
  void checkpoint();

  /// How often the file was damaged or taken away; 0 also when that cannot be told.
  [[nodiscard]] std::int64_t damageCount();

  /// Whether it is open, or it, a journal or a sign that it was opened once lies there.
  [[nodiscard]] bool isThere() const;

  /// Removes what was set aside.
  void removeSetAside();

 private:
  struct Connection;
  using Failure = std::optional<PlatformError>;

  [[nodiscard]] Failure attempt(Looking looking, const Work& operation);
  [[nodiscard]] Work ofThisFormat(const Work& work) const;
  [[nodiscard]] bool isFromBeforeFork() const;
  [[nodiscard]] bool isLost();
  [[nodiscard]] bool isTimeToLook() const;
  [[nodiscard]] Failure ensureOpen();
  [[nodiscard]] Result<std::unique_ptr<FileLock>> takeTurn();
  // With the turn taken:
  [[nodiscard]] Failure open();
  [[nodiscard]] Failure openWhole();
  [[nodiscard]] bool noteFiles();
  [[nodiscard]] Failure setUp(SQLiteDatabase& database, const std::string& path);
  [[nodiscard]] Failure check();
  [[nodiscard]] Failure moveAside(const std::string& reason);
  void finishMovingAside();
  void removeJournals();
  [[nodiscard]] Failure takeOverSetAside();
  [[nodiscard]] Failure putAway(const std::string& file);
  [[nodiscard]] Failure takeOverLost(SQLiteDatabase& lost, bool isCounted);
  [[nodiscard]] Failure takeOver(SQLiteDatabase& from, bool isCounted);
  // These take the turn:
  [[nodiscard]] Failure setAside(const PlatformError& damage);
  [[nodiscard]] Failure replaceLost();
  [[nodiscard]] PlatformError said(const PlatformError& error);
  void say(const std::string& what) const;

  const Ports ports_;
  const std::string path_;
  const std::string logPath_;
  const std::string indexPath_;
  const DurableFormat format_;
  const Migrating migrating_;

  LockDeadline deadline_{maxLockWait};
  int loggedPages_ = 0;  ///< Kept by the connection.
  std::unique_ptr<Connection> connection_;
  std::set<SQLiteFailure> said_;
};

}  // namespace Varnel::Platform
