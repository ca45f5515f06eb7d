// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// Which file a path leads to: another file behind the same path has another identity.
struct FileIdentity final {
  std::uint64_t device = 0;
  std::uint64_t inode = 0;
  bool isEmpty = false;  ///< Does not count in comparisons.

  bool operator==(const FileIdentity& other) const {
    return device == other.device && inode == other.inode;
  }
};

/// A lock that is held. Destruction frees it, and so does the end of the process, however it ends.
class VARNEL_API FileLock {
 public:
  virtual ~FileLock() = default;
};

/// The domain of errors that say: this is not the user's own file, so it is left alone.
inline constexpr std::string_view privateFileRefusalDomain = "PrivateFile";

/// Files that belong to this user alone, beside which a database keeps its journals ("-journal",
/// "-wal", "-shm").
///
///     auto path = files.prepare("/home/ann/.local/state/app/events.sqlite");
///     if (!path) return report(path.error());  // a link, a folder, somebody else's file …
///     auto lock = files.tryLock("/home/ann/.local/state/app/events.sqlite.lock");
///     if (lock && *lock) …                     // nobody else has it
///
/// No file is ever opened that could be a database's: closing it would drop the database's locks.
/// Any thread. Errors are the system's (generic category), or of `privateFileRefusalDomain`. A path
/// with a null character leads to no file (`invalid_argument`).
class VARNEL_API PrivateFiles {
 public:
  virtual ~PrivateFiles() = default;
  PrivateFiles& operator=(const PrivateFiles&) = delete;

  /// Makes missing folders (0700); refused is to make one in somebody else's, root included. One
  /// that exists is left as it is, whosever it is.
  [[nodiscard]] virtual std::optional<PlatformError> makeFolders(const std::string& path) = 0;

  /// Makes missing folders (0700) and, if it is missing, the file (0600, empty), and returns the
  /// absolute path to open it by, with no link in it. Links among the folders are followed. Refused
  /// is a folder that belongs to somebody else, and a file or journal that is not a regular file of
  /// this user; nothing that exists is changed.
  [[nodiscard]] virtual Result<std::string> prepare(const std::string& path) = 0;

  /// Lets this user alone read and write the file and its journals, as `prepare` has found them,
  /// where the file system can tell users apart and be written.
  [[nodiscard]] virtual std::error_code protect(const std::string& path) = 0;

  /// The file at the path, which is not opened; absent when there is none.
  [[nodiscard]] virtual std::optional<FileIdentity> identity(const std::string& path) = 0;

  /// Locks a file that serves as a lock alone and is prepared first; null when somebody has it,
  /// this process included. Never waits. A program that the process starts does not hold it.
  [[nodiscard]] virtual Result<std::unique_ptr<FileLock>> tryLock(const std::string& path) = 0;

  /// Gives a file another name in its folder, and replaces what has that name.
  [[nodiscard]] virtual std::error_code rename(const std::string& from, const std::string& to) = 0;

  /// Removes a file; one that is missing is no error.
  [[nodiscard]] virtual std::error_code remove(const std::string& path) = 0;
};

}  // namespace Varnel::Platform
