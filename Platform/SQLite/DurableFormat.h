// SPDX-License-Identifier: MIT
#pragma once

#include <compare>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

class SQLiteDatabase;

/// A format's version. A new minor version adds columns with defaults, which older programs ignore;
/// a new major version may do anything.
struct FormatVersion final {
  int major = 1;
  int minor = 0;

  auto operator<=>(const FormatVersion&) const = default;
};

/// The way from one version to the next of the list. A table that it makes is written as in the
/// schema; otherwise the file counts as damaged.
struct Migration final {
  FormatVersion from;
  std::string sql;  ///< Statements without a transaction of their own.
};

/// A table whose rows are saved when the file that holds them is lost or damaged. Rows are inserted
/// where no row with the same key exists: a row of the schema itself stays, and so does one that
/// was written since.
struct SavedTable final {
  std::string name;
  /// A number by which the file itself counts the rows: a saved row gets a new one.
  std::string ownNumber = {};
};

/// Whether a file of an earlier version may be changed into one of this.
enum class Migrating {
  allowed,  ///< For the product's own host.
  never     ///< An earlier minor version is used as it is; an earlier major version is unavailable.
};

/// What a durable file holds.
struct DurableFormat final {
  enum class Journal {
    rollback,   ///< The plain journal.
    writeAhead  ///< Readers and the one writer do not wait for one another. Where the file system
                ///< cannot, the plain one is used.
  };
  enum class Synchronisation {
    survivesKill,      ///< A change outlives the process, not always a loss of power.
    survivesPowerLoss  ///< A change waits for the disk.
  };

  std::string subject;             ///< For the system's log: "notifications".
  std::int32_t applicationID = 0;  ///< Not 0. A file with another one is refused.
  FormatVersion version;
  /// Statements that make an empty file one of this format: "CREATE TABLE NAME(…);" and so on.
  std::string schema;
  std::vector<Migration> migrations;  ///< Without gaps, the oldest first.
  Journal journal = Journal::rollback;
  Synchronisation synchronisation = Synchronisation::survivesPowerLoss;
  std::vector<SavedTable> tables;  ///< Every table whose rows are to be saved.
};

/// Judges an open file before anything in it is changed. Returns why it cannot be used, or none. An
/// empty file is no objection.
[[nodiscard]] std::optional<PlatformError> judgeFormat(SQLiteDatabase& database,
                                                       const DurableFormat& format,
                                                       Migrating migrating);

/// Makes an empty file one of this format and migrates one of an earlier version, each in one
/// transaction, where that may be done. To be called on a file that `judgeFormat` let pass.
[[nodiscard]] std::optional<PlatformError> applyFormat(SQLiteDatabase& database,
                                                       const DurableFormat& format,
                                                       Migrating migrating);

}  // namespace Varnel::Platform
