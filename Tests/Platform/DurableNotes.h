// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include <Tests/Support/AsUser.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/SQLite/DurableFile.h>

/// A small format, and what tests do with a durable file of it.
namespace Varnel::Tests {

using Failure = std::optional<Platform::PlatformError>;
using Journal = Platform::DurableFormat::Journal;

inline Platform::DurableFormat notes(Journal journal) {
  return {.subject = "notes",
          .applicationID = 0x4E4F5445,
          .version = {1, 0},
          .schema = "CREATE TABLE note(id INTEGER PRIMARY KEY, key TEXT NOT NULL UNIQUE)",
          .migrations = {},
          .journal = journal,
          .synchronisation = Platform::DurableFormat::Synchronisation::survivesKill,
          .tables = {{.name = "note", .ownNumber = "id"}}};
}

/// Keeps what the system's log would be told.
class Lines final : public Platform::SystemLog {
 public:
  void write(std::string_view line) override { lines.emplace_back(line); }
  std::vector<std::string> lines;
};

/// A durable file with the log that it writes to.
struct Notebook final {
  explicit Notebook(const std::filesystem::path& path, Platform::DurableFormat format,
                    Platform::Migrating migrating = Platform::Migrating::allowed,
                    Platform::PrivateFiles* files = nullptr)
      : file({files ? *files : *ownFiles, log}, path.string(), std::move(format), migrating) {}

  /// By one statement, and whether it was kept: "kept", or what the error means.
  std::string add(
      const std::string& key, const std::function<void()>& afterwards = {},
      Platform::DurableFile::Looking looking = Platform::DurableFile::Looking::eachTime) {
    return meaning(file.changeByOneStatement(inserting(key, afterwards), looking));
  }

  /// The same in a transaction.
  std::string change(const std::string& key, const std::function<void()>& afterwards = {}) {
    return meaning(file.change(inserting(key, afterwards)));
  }

  /// Removes all keys.
  std::string clear() {
    return meaning(file.change(
        [](Platform::SQLiteDatabase& database) { return database.run("DELETE FROM note"); }));
  }

  /// All keys in a row, or what the error means.
  std::string keys() {
    std::string found;
    const auto error = file.read([&](Platform::SQLiteDatabase& database) {
      found.clear();
      return database.each("SELECT key FROM note ORDER BY key",
                           [&](auto& row) { found += row.text(0).value_or(""); });
    });
    return error ? meaning(error) : found;
  }

  using Work = std::function<Failure(Platform::SQLiteDatabase&)>;
  static Work inserting(const std::string& key, const std::function<void()>& afterwards) {
    return [&](Platform::SQLiteDatabase& database) {
      auto error = insert(database, key);
      if (afterwards) afterwards();
      return error;
    };
  }
  static Failure insert(Platform::SQLiteDatabase& database, const std::string& key) {
    return database.run("INSERT OR IGNORE INTO note(key) VALUES(?)", key);
  }

  static std::string meaning(const Failure& error) {
    using enum Platform::SQLiteFailure;
    static const std::map<Platform::SQLiteFailure, std::string> names{
        {busy, "busy"},   {damaged, "damaged"}, {full, "full"},      {readOnly, "read-only"},
        {newer, "newer"}, {older, "older"},     {refused, "refused"}};
    if (!error) return "kept";
    const auto name = names.find(meaningOf(*error));
    return name == names.end() ? error->description() : name->second;
  }

  std::unique_ptr<Platform::PrivateFiles> ownFiles = Platform::POSIX::makePrivateFiles();
  Lines log;
  Platform::DurableFile file;
};

}  // namespace Varnel::Tests
