// SPDX-License-Identifier: MIT
// The cookies that a browser or a library of the desktop has kept.
#include <Fuzz/ForgedDatabase.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Varnel/Platform/Generic/SQLiteCookieStorage.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

using namespace Varnel::Platform;

static void fuzz(std::string_view input) {
  static const ForgedDatabase database("cookies.sqlite", [](const std::string& path) {
    Varnel::Tests::runSQL(
        path,
        "PRAGMA page_size = 512; CREATE TABLE moz_cookies(id INTEGER PRIMARY KEY, name TEXT,"
        " value TEXT, host TEXT, path TEXT, expiry INTEGER, lastAccessed INTEGER,"
        " isSecure INTEGER, isHttpOnly INTEGER, sameSite INTEGER);"
        "INSERT INTO moz_cookies VALUES(1, 'source', 'a', '.example.org', '/', 4000000000, 1, 1, 0,"
        " 0), (2, 'old', 'b', 'example.org', '/b', 1, 1, 0, 0, 0);");
  });
  database.forge(input);
  const Testing::SimulatedClock clock(Date(std::chrono::hours(490'000)));
  const auto folder = std::filesystem::path(database.path()).parent_path();
  SQLiteCookieStorage jar(folder.parent_path(), folder.filename().string(), clock);
  const auto cookies = jar.cookies();
  if (input.empty()) require(cookies.size() == 1 && cookies[0].name == "source");
}
