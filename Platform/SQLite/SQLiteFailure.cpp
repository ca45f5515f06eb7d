// SPDX-License-Identifier: MIT
#include <Varnel/Platform/SQLite/SQLiteFailure.h>

#include <sqlite3.h>

#include <cerrno>
#include <system_error>

#include <Varnel/Platform/Ports/PrivateFiles.h>

namespace Varnel::Platform {
namespace {

constexpr const char* domain = "DurableFile";
constexpr long primaryCodeMask = 0xff;

SQLiteFailure meaningOfSQLite(long code) {
  switch (code) {
    case SQLITE_IOERR_SHORT_READ:
    case SQLITE_IOERR_CORRUPTFS:
    case SQLITE_IOERR_DATA:
      return SQLiteFailure::damaged;
    default:
      break;
  }
  switch (code & primaryCodeMask) {
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
    case SQLITE_PROTOCOL:
      return SQLiteFailure::busy;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
      return SQLiteFailure::damaged;
    case SQLITE_FULL:
      return SQLiteFailure::full;
    case SQLITE_READONLY:
    case SQLITE_PERM:
      return SQLiteFailure::readOnly;
    default:
      return SQLiteFailure::other;
  }
}

SQLiteFailure meaningOfSystem(long code) {
  switch (code) {
    case EAGAIN:
    case EBUSY:
      return SQLiteFailure::busy;
    case ENOSPC:
    case EDQUOT:
      return SQLiteFailure::full;
    case EROFS:
    case EACCES:
    case EPERM:
      return SQLiteFailure::readOnly;
    default:
      return SQLiteFailure::other;
  }
}

}  // namespace

SQLiteFailure meaningOf(const PlatformError& error) {
  if (error.domain() == domain) return static_cast<SQLiteFailure>(error.code());
  if (error.domain() == privateFileRefusalDomain) return SQLiteFailure::refused;
  if (error.domain() == "SQLite") return meaningOfSQLite(error.code());
  const bool isSystem = error.domain() == std::generic_category().name() ||
                        error.domain() == std::system_category().name();
  return isSystem ? meaningOfSystem(error.code()) : SQLiteFailure::other;
}

PlatformError fileError(SQLiteFailure meaning, const std::string& description) {
  return PlatformError(domain, static_cast<long>(meaning),
                       {{std::string(localizedDescriptionKey), description}});
}

}  // namespace Varnel::Platform
