// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// A regular file as somebody has examined it. A file that was replaced or written to since has
/// another state; moving it within its file system changes nothing here.
struct FileState final {
  std::uint64_t device = 0;
  std::uint64_t inode = 0;
  std::uint64_t size = 0;     ///< In bytes.
  std::int64_t modified = 0;  ///< In seconds since 1970-01-01 UTC, and
  std::int32_t nanoseconds = 0;

  bool operator==(const FileState&) const = default;
};

/// A file in the trash: what a journal keeps to put it back, also after a restart.
struct TrashedFile final {
  std::string folder;  ///< The trash that has it: an absolute path.
  std::string name;    ///< Its name there, which may differ from its own.
  std::string path;    ///< Where it was: an absolute path.
  FileState state;

  bool operator==(const TrashedFile&) const = default;
};

/// Why a file was not moved.
struct TrashError final {
  enum class Reason {
    changed,        ///< The path does not lead to that very file in that state, or by a link.
    declined,       ///< `Ready` did not want it.
    emptied,        ///< The trash does not have the file any more.
    failed,         ///< The system's error says why.
    folderMissing,  ///< The folder that it was in is not there.
    misplaced,      ///< What came between stayed where it was moved: its own place was taken.
    noTrash,        ///< No trash that this user could use, or one whose disk is not there.
    occupied,       ///< Something else has its place.
  };

  Reason reason = Reason::failed;
  std::error_code code{};  ///< The system's (generic category), where it has said something.
  TrashedFile file{};      ///< What was misplaced, and where it is.
};

/// The trash of the user's desktop. A file is at all times in its place or in the trash, with all
/// that is needed to put it back, however the process ends and whatever other programs do
/// meanwhile; nothing is ever replaced.
///
///     const auto trashed = trash.move(path, stateWhenCompared, [&](const TrashedFile& planned) {
///       return isStillADuplicate(path) && journal.append(planned);
///     });
///     …
///     if (const auto error = trash.restore(*trashed, Trash::Folders::leave)) report(*error);
///
/// Paths are absolute, and no folder in them is a link (as in what `realpath` gives): one that is a
/// link may have been put there since. Other paths, and those with a null character, are no paths
/// (`invalid_argument`). Bytes that are no text are fine. Any thread; calls block for
/// as long as the disk takes to keep a small file.
class VARNEL_API Trash {
 public:
  /// What to do about folders that are missing when a file is put back.
  enum class Folders {
    leave,     ///< Nothing: the file stays in the trash.
    recreate,  ///< Make them, for this user alone.
  };
  /// Told where the file will be, right before it is moved there; false leaves it where it is. Told
  /// again where that name or that trash would not do. It must not throw.
  using Ready = std::function<bool(const TrashedFile& planned)>;

  virtual ~Trash() = default;
  Trash& operator=(const Trash&) = delete;

  /// What the path leads to: the state of a regular file, or `changed` where it is none.
  [[nodiscard]] virtual Result<FileState, TrashError> state(const std::string& path) = 0;

  /// Whether the path lies in a trash: the user's, or, as its name tells, that of a volume, of
  /// another user or of another system. What is there may be gone at any moment.
  [[nodiscard]] virtual bool isInTrash(const std::string& path) = 0;

  /// The trash that a file with this path would go to, or `noTrash`. Makes it when it is missing,
  /// and touches nothing else. The answer is no promise: `move` has the last word.
  [[nodiscard]] virtual Result<std::string, TrashError> folderFor(const std::string& path) = 0;

  /// Moves the file into the trash of its file system, if it is in the state `expected` before and
  /// after; otherwise it is back in its place. Of a file with several names that one alone goes.
  [[nodiscard]] virtual Result<TrashedFile, TrashError> move(const std::string& path,
                                                             const FileState& expected,
                                                             const Ready& ready) = 0;

  /// Puts a file back into its place. It is known by its former path, its size and its time:
  /// numbers of devices do not last.
  [[nodiscard]] virtual std::optional<TrashError> restore(const TrashedFile& file,
                                                          Folders folders) = 0;

  /// The regular files in one trash, whoever has put them there, in the order of their names. A
  /// trash that is not there has none.
  [[nodiscard]] virtual Result<std::vector<TrashedFile>, TrashError> contents(
      const std::string& folder) = 0;
};

}  // namespace Varnel::Platform
