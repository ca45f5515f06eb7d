// SPDX-License-Identifier: MIT
// The database of downloads.
#include <Fuzz/ForgedDatabase.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <Varnel/Provenance/KVQuarantine.h>

using namespace Varnel;

static void fuzz(std::string_view input) {
  static const ForgedDatabase database("Downloads.db", [](const std::string& path) {
    Tests::runSQL(path, "PRAGMA page_size = 512;" + Tests::createQuarantineTable() +
                            Tests::insertDownload("'E1'", "'https://example.org/a.zip'") +
                            Tests::insertDownload("'E2'", "NULL"));
  });
  database.forge(input);
  Platform::Testing::CapturedSystemLog log;
  for (const KVQuarantineEntry& entry : KVQuarantine(database.path(), log).entries())
    require(entry.dataURLString() && Platform::isValidUTF8(*entry.dataURLString()));
}
