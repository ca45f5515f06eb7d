// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/SQLiteCookieStorage.h>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

constexpr const char* fileName = "cookies.sqlite";
constexpr std::chrono::milliseconds patience{500};

std::int64_t secondsOf(Date date) {
  return std::chrono::floor<std::chrono::seconds>(date).time_since_epoch().count();
}

// An identifier must be the name of one folder, not a path to another place.
bool isFolderName(const std::string& name) {
  return !name.empty() && name != "." && name != ".." && name.find('/') == std::string::npos;
}

std::string textOf(SQLiteStatement& row, int column) {
  return std::string(row.text(column).value_or(std::string_view()));
}

}  // namespace

SQLiteCookieStorage::SQLiteCookieStorage(fs::path dataFolder, std::string application,
                                         const Clock& clock)
    : dataFolder_(std::move(dataFolder)), application_(std::move(application)), clock_(clock) {}

std::vector<Cookie> SQLiteCookieStorage::cookies() {
  if (!isFolderName(application_)) return {};
  return cookiesIn(dataFolder_ / application_);
}

std::vector<Cookie> SQLiteCookieStorage::cookiesOfGroupContainer(const std::string& identifier) {
  if (!isFolderName(identifier)) return {};
  return cookiesIn(dataFolder_ / "group-containers" / identifier);
}

std::vector<Cookie> SQLiteCookieStorage::cookiesIn(const fs::path& folder) const {
  std::vector<Cookie> cookies;
  auto database =
      SQLiteDatabase::open((folder / fileName).string(), SQLiteDatabase::Access::readOnly);
  if (!database) return cookies;
  database->setBusyTimeout(patience);
  auto rows = database->prepare("SELECT host, path, name, value FROM moz_cookies WHERE expiry > ?");
  if (!rows) return cookies;
  rows->bind(1, secondsOf(clock_.now()));
  while (true) {
    const auto step = rows->step();
    if (!step || *step == SQLiteStatement::Step::done) return cookies;
    cookies.push_back({.domain = textOf(*rows, 0),
                       .path = textOf(*rows, 1),
                       .name = textOf(*rows, 2),
                       .value = textOf(*rows, 3)});
  }
}

}  // namespace Varnel::Platform
