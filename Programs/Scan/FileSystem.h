// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <system_error>
#include <vector>

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

/// Tells one state of a file's content from another.
struct FileStatus {
  FileIdentity identity;
  std::uint64_t size = 0;       ///< Bytes.
  std::int64_t modifiedAt = 0;  ///< Nanoseconds since 1970.

  bool operator==(const FileStatus&) const = default;
};

/// The content of one folder: its regular files and its folders, by name and in no order.
/// Everything else in it (symbolic links, devices, sockets, pipes) is left out.
struct FolderListing {
  struct File {
    std::string name;
    FileStatus status;
  };
  struct Failure {
    std::string name;
    std::error_code error;
  };

  FileIdentity identity;
  std::vector<std::string> folders;
  std::vector<File> files;
  std::vector<Failure> failures;  ///< Entries whose status could not be had.
  std::error_code interruption;   ///< Why there may be more in the folder; none when this is all.
};

/// A regular file that is open for reading. One thread at a time; closed when destroyed.
class OpenFile {
 public:
  virtual ~OpenFile() = default;

  /// Reads the next bytes, as many as there are and `buffer` holds; 0 at the end of the file.
  [[nodiscard]] virtual FileResult<std::size_t> read(std::span<std::byte> buffer) = 0;

  /// The file's status as it is now.
  [[nodiscard]] virtual FileResult<FileStatus> status() = 0;
};

/// How the reader of a file is going to read.
enum class ReadingPlan { beginningOnly, everything };

/// What the scan asks of the file system. Any thread. Paths are absolute runs of bytes, of any
/// length. No call follows a symbolic link in any part of a path.
class FileSystem {
 public:
  virtual ~FileSystem() = default;

  /// Lists a folder, as far as it can be read.
  [[nodiscard]] virtual FileResult<FolderListing> list(const std::string& folder) = 0;

  /// Opens a file, and never waits for the other end of a pipe that took the file's place. The
  /// status tells whether it is still a file, and which one.
  [[nodiscard]] virtual FileResult<std::unique_ptr<OpenFile>> open(const std::string& path,
                                                                   ReadingPlan plan) = 0;
};

/// The file system of the machine. It lives as long as the process.
[[nodiscard]] FileSystem& systemFileSystem();

}  // namespace Orvane
