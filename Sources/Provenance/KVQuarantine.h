// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Provenance/KVQuarantineEntry.h>

namespace Varnel::Platform {
class ExtendedAttributes;
class SystemLog;
class UserAccount;
}  // namespace Varnel::Platform

namespace Varnel {

/// Reads the system's database of downloads, and the attribute that a download leaves on a file.
///
///     for (const auto& entry : KVQuarantine::systemQuarantine()->entries())
///       std::cout << entry.dataURLString().value_or("") << '\n';
///
/// Each call opens the database, reads and closes it. Any thread; calls read files.
class VARNEL_API KVQuarantine final {
 public:
  /// The database at `path`. The log, by default the system's, outlives the reader.
  explicit KVQuarantine(std::string path);
  KVQuarantine(std::string path, Platform::SystemLog& systemLog);

  /// A reader of this user's current database.
  [[nodiscard]] static std::shared_ptr<KVQuarantine> systemQuarantine();

  /// The database's place in earlier versions of the system, and its present place. The account
  /// defaults to the process's user, here and below.
  [[nodiscard]] static std::string systemQuarantinePath();
  [[nodiscard]] static std::string systemQuarantinePath(const Platform::UserAccount& account);
  [[nodiscard]] static std::string systemQuarantinePathV2();
  [[nodiscard]] static std::string systemQuarantinePathV2(const Platform::UserAccount& account);

  /// The current database and the earlier one, whether they exist or not.
  [[nodiscard]] static std::vector<Platform::URL> downloadsLogsURLs();
  [[nodiscard]] static std::vector<Platform::URL> downloadsLogsURLs(
      const Platform::UserAccount& account);

  /// The fields of a file's "com.apple.quarantine" attribute, split at each ";", empty ones
  /// included: flags, time, agent, event identifier. Absent when the file has no such attribute,
  /// it cannot be read or is not UTF-8. Symbolic links are followed.
  [[nodiscard]] static std::optional<std::vector<std::string>> quarantineXATTRsForPath(
      const std::string& path);
  [[nodiscard]] static std::optional<std::vector<std::string>> quarantineXATTRsForPath(
      const std::string& path, Platform::ExtendedAttributes& attributes);

  [[nodiscard]] const std::string& path() const { return path_; }

  /// The rows with a data URL, in the database's order. Each entry has its event identifier (empty
  /// when the row has none) and its data URL; the rest is absent or 0. Without a table of downloads
  /// there are none. A file that cannot be opened is reported to the system's log; a missing file
  /// is created, empty.
  [[nodiscard]] std::vector<KVQuarantineEntry> entries() const;

 private:
  const std::string path_;
  Platform::SystemLog& systemLog_;
};

}  // namespace Varnel
