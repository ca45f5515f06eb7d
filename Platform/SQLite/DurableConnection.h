// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <utility>

#include <Varnel/Platform/SQLite/DurableFile.h>

namespace Varnel::Platform {

// What lies beside the file PATH:
//   PATH-journal, PATH-wal, PATH-shm    the library's
//   PATH.opening                        locked by the one who opens the file, or sets it aside
//   PATH.salvage                        was set aside, and its rows are not taken over yet: until
//                                       they are, nobody uses the file
//   PATH.damaged                        was set aside, and its rows are taken over
// A process may be killed after each step: the next one to open the file goes on from there.
inline constexpr const char* turnSuffix = ".opening";
inline constexpr const char* pendingSuffix = ".salvage";
inline constexpr const char* asideSuffix = ".damaged";

/// An open file. The write-ahead log and its index, if there are any, belong to it as the file
/// does.
struct DurableFile::Connection {
  Connection(SQLiteDatabase opened, int forks) : database(std::move(opened)), forksBefore(forks) {}

  SQLiteDatabase database;
  FileIdentity file;
  std::optional<FileIdentity> log;
  std::optional<FileIdentity> index;
  std::chrono::steady_clock::time_point lookedAt;
  const int forksBefore;  ///< How often the process had forked until then.
};

}  // namespace Varnel::Platform
