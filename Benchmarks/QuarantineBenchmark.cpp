// SPDX-License-Identifier: MIT

// Reading a hundred thousand downloads, against the loop over the C library that does nothing but
// look at the same two columns. Both sides take turns; only the ratios of one run mean anything.

#include <sqlite3.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <string>

#include <Benchmarks/Measurements.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Provenance/KVQuarantine.h>

namespace Varnel::Benchmarks {
namespace {

constexpr std::size_t rows = 100'000;
constexpr std::size_t rounds = 25;

std::string downloads() {
  return Tests::createQuarantineTable() +
         "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < " +
         std::to_string(rows) +
         ") INSERT INTO LSQuarantineEvent SELECT "
         "printf('%08X-2F8E-4C0B-9B1B-7B9D4E2A8C11', i), 600000000.5 + i, 'org.example.browser',"
         " 'Browser', 'https://downloads.example.org/files/' || i || '/archive.zip', NULL, NULL, 0,"
         " 'Downloads', 'https://downloads.example.org/', NULL FROM n";
}

void expect(bool holds) {
  if (!holds) std::abort();
}

// The bytes of the two columns in all rows.
std::size_t loopInC(const char* path) {
  sqlite3* database = nullptr;
  sqlite3_stmt* statement = nullptr;
  std::size_t bytes = 0;
  expect(sqlite3_open(path, &database) == SQLITE_OK);
  expect(sqlite3_prepare_v2(database, "SELECT * FROM LSQuarantineEvent", -1, &statement, nullptr) ==
         SQLITE_OK);
  while (sqlite3_step(statement) == SQLITE_ROW)
    for (const int column : {0, 4})
      bytes += std::strlen(reinterpret_cast<const char*>(sqlite3_column_text(statement, column)));
  sqlite3_finalize(statement);
  sqlite3_close(database);
  return bytes;
}

void run() {
  const Tests::TemporaryFolder folder;
  const std::string path = (folder.path() / "events").string();
  Tests::runSQL(path, downloads());
  Platform::Testing::CapturedSystemLog log;
  const KVQuarantine quarantine(path, log);

  Comparison comparison;
  comparison.measure(
      rounds, [&] { return timeOf([&] { expect(quarantine.entries().size() == rows); }); },
      [&] { return timeOf([&] { expect(loopInC(path.c_str()) > rows); }); });
  comparison.report("100,000 downloads / raw loop in C", 0.5, 1.75);
}

}  // namespace
}  // namespace Varnel::Benchmarks

int main() {
  Varnel::Benchmarks::run();
}
