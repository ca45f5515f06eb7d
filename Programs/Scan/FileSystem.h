// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Values/Result.h>

namespace Orvane {

template <typename Value>
using FileResult = Varnel::Platform::Result<Value, std::error_code>;

/// Identifies a file, whatever names it has.
struct FileIdentity {
  std::uint64_t device = 0;
  std::uint64_t inode = 0;

  auto operator<=>(const FileIdentity&) const = default;
};

/// With identity, size and time one state of a file's content is told from another.
struct FileStatus {
  FileIdentity identity;
  std::uint64_t size = 0;       ///< Bytes.
  std::int64_t modifiedAt = 0;  ///< Nanoseconds since 1970.
  std::uint64_t allocated = 0;  ///< Bytes that it takes up: none for its holes.
  std::uint32_t links = 1;      ///< Its names, wherever they are.
  std::int64_t changedAt = 0;   ///< As `modifiedAt`, of the status: nobody can set it.

  /// Whether both are the same state of one file's content.
  [[nodiscard]] bool hasContentOf(const FileStatus& other) const {
    return identity == other.identity && size == other.size && modifiedAt == other.modifiedAt;
  }
};

/// What a file holds together with other files of its volume.
struct SharedExtents {
  std::uint64_t bytes = 0;
  std::uint64_t place = 0;        ///< Files of one place share everything with one another.
  std::uint64_t inlineBytes = 0;  ///< They lie with the file's facts, and are never shared.
};

/// A regular file that is open for reading. One thread at a time; closed when destroyed.
class OpenFile {
 public:
  virtual ~OpenFile() = default;

  /// Reads from a place of the file as many bytes as there are and `buffer` holds; 0 at its end.
  [[nodiscard]] virtual FileResult<std::size_t> read(std::uint64_t offset,
                                                     std::span<std::byte> buffer) = 0;

  /// The file's status as it is now.
  [[nodiscard]] virtual FileResult<FileStatus> status() = 0;

  /// Where on the volume the content begins, in bytes; nothing when that cannot be told.
  [[nodiscard]] virtual std::optional<std::uint64_t> place() = 0;

  /// What it shares with other files; nothing when that cannot be told.
  [[nodiscard]] virtual std::optional<SharedExtents> sharedExtents() = 0;

  /// Lets a part of the file lie where the same part of `source` lies, if the system finds the same
  /// bytes in both. Bytes and times stay as they are. Returns how many bytes lie there now, from
  /// the part's beginning on; nothing when they differ. A length of 0 asks whether the system would
  /// do it. `source` is of the same `FileSystem`.
  [[nodiscard]] virtual FileResult<std::optional<std::uint64_t>> share(OpenFile& source,
                                                                       std::uint64_t offset,
                                                                       std::uint64_t length) = 0;
};

/// How the reader of a file is going to read.
enum class ReadingPlan { parts, everything };

/// What is in a folder, or could not be looked at.
struct FolderEntry {
  enum class Kind {
    file,  ///< A regular one.
    folder,
    other,  ///< A symbolic link, a device, a socket or a pipe.
    failure,
  };

  Kind kind;
  const char* name;         ///< Valid during the call.
  std::uint64_t inode;      ///< Of a folder; below a mount, that of the folder under it.
  FileStatus status{};      ///< Of a file.
  std::error_code error{};  ///< Of a failure.
};

/// A folder that is open. Whatever happens to its path meanwhile, it remains the same folder. One
/// thread at a time; closed when destroyed.
class OpenFolder {
 public:
  virtual ~OpenFolder() = default;

  [[nodiscard]] virtual FileIdentity identity() const = 0;

  /// Calls `visit` for the next few entries; each call goes on where the last one ended. False when
  /// there are no more.
  [[nodiscard]] virtual FileResult<bool> list(
      const std::function<void(const FolderEntry&)>& visit) = 0;

  /// The entry of this name.
  [[nodiscard]] virtual FolderEntry look(const char* name) = 0;

  /// Whether its files keep their numbers while nobody has them in use.
  [[nodiscard]] virtual bool keepsNumbers() const = 0;

  /// Whether its volume lets files share extents, and tells which do.
  [[nodiscard]] virtual bool mayShareExtents() const = 0;

  /// Opens a file in the folder, and never waits for the other end of a pipe that took the file's
  /// place. The status tells whether it is still a file, and which one.
  [[nodiscard]] virtual FileResult<std::unique_ptr<OpenFile>> open(const char* name,
                                                                   ReadingPlan plan) = 0;
};

/// What the scan asks of the file system. Any thread. Names are runs of bytes, paths of any length.
/// No call follows a symbolic link in any part of a path.
class FileSystem {
 public:
  virtual ~FileSystem() = default;

  /// Opens a folder by an absolute path or, with `base`, by the names that lead down from there.
  [[nodiscard]] virtual FileResult<std::unique_ptr<OpenFolder>> openFolder(
      OpenFolder* base, const std::string& path) = 0;
};

/// What reading leaves in the system's page cache: what it read, or what was there before.
enum class CacheUse { normal, traceless };

/// The file system of the machine. It lives as long as the process.
[[nodiscard]] FileSystem& systemFileSystem(CacheUse cacheUse = CacheUse::normal);

}  // namespace Orvane
