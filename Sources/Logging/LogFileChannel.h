// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>

#include <Varnel/Logging/LogWritePolicy.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/StandardOutput.h>

namespace Varnel {

/// Appends log entries to a file without making their authors wait for the disk: entries gather in
/// memory, and a thread of the channel's own opens the file, and writes the gathered entries when
/// the policy says so. Entries are written in the order of their `append`, each whole.
///
/// A file that cannot be opened is reported on the standard output, and later entries are dropped.
/// A failed write is reported once for each entry that it carried; later ones are tried again.
///
/// Any thread. Destruction writes what has gathered.
class LogFileChannel final {
 public:
  enum class Start {
    atOnce,
    withTheFirstEntry,  ///< Before it there is neither a file nor a thread.
  };

  LogFileChannel(Platform::AppendFiles& files, Platform::StandardOutput& output, std::string path,
                 LogWritePolicy policy = {}, Start start = Start::atOnce);
  ~LogFileChannel();
  LogFileChannel(const LogFileChannel&) = delete;
  LogFileChannel& operator=(const LogFileChannel&) = delete;

  /// Adds an entry to what is to be written. Never waits for the disk, unless `writeThrough` was
  /// called.
  void append(std::string_view entry);

  /// Writes everything appended before the call; returns when the system has it.
  void flush();

  /// Flushes, and from now on writes each entry inside its `append`: for a process that is about to
  /// end, when nobody may be left to write later.
  void writeThrough();

 private:
  using Clock = std::chrono::steady_clock;

  struct Batch {
    std::string bytes;
    std::size_t entries = 0;
  };

  void startWriter();
  void runWriter();
  void openFile();
  void write(const Batch& batch);

  Platform::AppendFiles& files_;
  Platform::StandardOutput& output_;
  const std::string path_;
  const LogWritePolicy policy_;

  /// Held while the file is used, so that batches are written in the order they were taken. Taken
  /// before `gatherMutex_`, never by an author of entries. Owns the three members below.
  std::mutex fileMutex_;
  bool isOpened_ = false;
  std::unique_ptr<Platform::AppendFile> file_;  ///< Null when it could not be opened.
  Batch written_;                               ///< Kept for its memory.

  /// Held for a few instructions only. Owns the members below.
  std::mutex gatherMutex_;
  std::condition_variable wakeUp_;
  Batch gathered_;
  Clock::time_point since_ = Clock::now();  ///< Of the first waiting byte, or of the last write.
  std::size_t wakeMark_;  ///< This many bytes wake the writer. While it is awake or rests, more
                          ///< than there can be.
  bool isStarted_;
  bool isEnded_ = false;  ///< The file could not be opened.
  bool writesThrough_ = false;
  bool isClosing_ = false;

  std::thread writer_;
};

}  // namespace Varnel
