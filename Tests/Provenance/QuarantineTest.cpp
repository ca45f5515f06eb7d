// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVQuarantine.h>

#include <gmock/gmock.h>
#include <sqlite3.h>

#include <memory>

#include <Tests/Support/OpenDescriptors.h>
#include <Tests/Support/OtherProcess.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>
#include <Varnel/Platform/Testing/FakeUser.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using Platform::PropertyDictionary;
using Platform::PropertyValue;
using Platform::SQLiteDatabase;
using testing::ElementsAre;
using Tests::insertDownload;

using Fields = std::vector<std::string>;

// What was read, as "identifier URL".
Fields summaryOf(const std::vector<KVQuarantineEntry>& entries) {
  Fields lines;
  for (const auto& entry : entries)
    lines.push_back(std::string(entry.eventIdentifier().value_or("?")) + " " +
                    std::string(entry.dataURLString().value_or("?")));
  return lines;
}

class Quarantine : public testing::Test {
 protected:
  // Reads the database, and checks that nothing of it stays open.
  Fields read(const fs::path& file) {
    const auto descriptors = Tests::openDescriptors();
    const auto memory = ::sqlite3_memory_used();
    const Fields entries = summaryOf(KVQuarantine(file.string(), log).entries());
    EXPECT_EQ(Tests::openDescriptors(), descriptors) << file;
    EXPECT_EQ(::sqlite3_memory_used(), memory) << file;
    return entries;
  }

  fs::path database(const std::string& sql) {
    const fs::path file = folder.path() / std::to_string(++count) / "events";
    Tests::runSQL(file, sql);
    return file;
  }

  const Tests::TemporaryFolder folder;
  Platform::Testing::CapturedSystemLog log;
  int count = 0;
};

TEST_F(Quarantine, ListsTheRowsWithADataURLInTheirOrder) {
  const auto file =
      database(Tests::createQuarantineTable() + insertDownload("'E2'", "'https://example.org/b'") +
               insertDownload("'E1'", "NULL") + insertDownload("NULL", "'https://example.org/c'") +
               insertDownload("'E3'", "CAST(x'68FF' AS TEXT)") +
               insertDownload("CAST(x'C0AF' AS TEXT)", "'ü'") + insertDownload("'E4'", "''"));
  EXPECT_THAT(read(file),
              ElementsAre("E2 https://example.org/b", " https://example.org/c", " ü", "E4 "));
  EXPECT_EQ(log.text(), "");

  const KVQuarantineEntry entry = KVQuarantine(file.string(), log).entries().front();
  EXPECT_EQ(entry.timestamp(), 0);
  EXPECT_EQ(entry.type(), 0);
  EXPECT_FALSE(entry.agentName() || entry.agentBundleIdentifier() || entry.senderName() ||
               entry.senderAddress() || entry.originTitle() || entry.originURLString() ||
               entry.originAlias());
}

TEST_F(Quarantine, ADatabaseWithoutUsableTableIsEmpty) {
  EXPECT_THAT(read(database("CREATE TABLE Other (a)")), ElementsAre());
  EXPECT_THAT(read(folder.write("text", std::string(5000, 'x'))), ElementsAre());
  // A table of fewer columns than are read has no data URLs.
  EXPECT_THAT(read(database("CREATE TABLE LSQuarantineEvent (a, b);"
                            "INSERT INTO LSQuarantineEvent VALUES ('E', 'u')")),
              ElementsAre());
  // The file breaks off behind the first pages: what could be read stays.
  std::string rows = Tests::createQuarantineTable();
  for (int i = 0; i < 500; ++i) rows += insertDownload(std::to_string(i), "'https://example.org'");
  const fs::path cut = database(rows);
  fs::resize_file(cut, fs::file_size(cut) / 2);
  EXPECT_LT(read(cut).size(), 500U);
  EXPECT_EQ(log.text(), "");
}

TEST_F(Quarantine, ALockedDatabaseIsEmptyAndNotWaitedFor) {
  const fs::path file =
      database(Tests::createQuarantineTable() + insertDownload("'E'", "'https://example.org'"));
  {
    const Tests::OtherProcess writer([&] {
      auto connection = std::make_unique<SQLiteDatabase>(*SQLiteDatabase::open(file.string()));
      return connection->execute("BEGIN EXCLUSIVE") ? nullptr : std::move(connection);
    });
    ASSERT_TRUE(writer.isReady());
    EXPECT_THAT(read(file), ElementsAre());
  }
  EXPECT_THAT(read(file), ElementsAre("E https://example.org"));
  EXPECT_EQ(log.text(), "");
}

TEST_F(Quarantine, AMissingFileIsCreatedEmptyAndWhatCannotBeOpenedIsLogged) {
  const fs::path file = folder.path() / "new";
  EXPECT_THAT(read(file), ElementsAre());
  EXPECT_EQ(fs::file_size(file), 0U);
  EXPECT_EQ(log.text(), "");
  EXPECT_THAT(read(folder.path()), ElementsAre());
  EXPECT_EQ(log.text(), "Failed to open database!\n");
  EXPECT_THAT(read(folder.path() / "missing" / "events"), ElementsAre());
  EXPECT_EQ(log.text(), "Failed to open database!\nFailed to open database!\n");
}

TEST(QuarantinePaths, TheCurrentDatabaseComesBeforeTheEarlierOne) {
  Platform::Testing::FakeUserAccount account;
  account.realHome = "/elsewhere";
  const std::string base =
      "/home/ada/Library/Preferences/com.apple.LaunchServices.QuarantineEvents";
  EXPECT_EQ(KVQuarantine::systemQuarantinePath(account), base);
  EXPECT_EQ(KVQuarantine::systemQuarantinePathV2(account), base + "V2");
  const auto urls = KVQuarantine::downloadsLogsURLs(account);
  ASSERT_EQ(urls.size(), 2U);
  EXPECT_EQ(urls[0].path(), base + "V2");
  EXPECT_EQ(urls[1].path(), base);
  EXPECT_EQ(KVQuarantine::systemQuarantine()->path(), KVQuarantine::systemQuarantinePathV2());
}

TEST(QuarantineAttribute, SplitsAtEverySemicolon) {
  Platform::Testing::FakeExtendedAttributes attributes;
  const auto split = [&](const std::string& value) {
    attributes.values[{"/f", "com.apple.quarantine"}] = value;
    return KVQuarantine::quarantineXATTRsForPath("/f", attributes);
  };
  EXPECT_EQ(split(""), Fields{""});
  EXPECT_EQ(split(";;"), (Fields{"", "", ""}));
  EXPECT_EQ(split("0083;\xFF"), std::nullopt);
  EXPECT_EQ(KVQuarantine::quarantineXATTRsForPath("/other", attributes), std::nullopt);
  attributes.error = std::make_error_code(std::errc::permission_denied);
  EXPECT_EQ(KVQuarantine::quarantineXATTRsForPath("/f", attributes), std::nullopt);
}

TEST(QuarantineEntry, TheSendersNameIsTheAddress) {
  const PropertyDictionary record = {
      {"LSQuarantineSenderName", "Ada"},
      {"LSQuarantineSenderAddress", "ada@example.org"},
      {"LSQuarantineAgentName", "Browser"},
      {"LSQuarantineOriginURLString", std::int64_t{7}},
      {"LSQuarantineDataURLString", "https://example.org"},
      {"LSQuarantineOriginAlias", Platform::PropertyData{std::byte{1}}},
  };
  const auto entry = KVQuarantineEntry::entryWithDictionary(record);
  EXPECT_EQ(entry.senderName(), "ada@example.org");
  EXPECT_EQ(entry.senderAddress(), "ada@example.org");
  EXPECT_EQ(entry.agentName(), "Browser");
  EXPECT_EQ(entry.originURLString(), std::nullopt);
  EXPECT_EQ(entry.dataURLString(), "https://example.org");
  EXPECT_EQ(entry.originAlias(), PropertyValue(Platform::PropertyData{std::byte{1}}));
  EXPECT_EQ(entry.eventIdentifier(), std::nullopt);
}

TEST(QuarantineEntry, NumbersAreReadFromWhateverCanBeOne) {
  constexpr auto largest = std::numeric_limits<std::int64_t>::max();
  const std::tuple<PropertyValue, double, std::int64_t> cases[] = {
      {-2.75, -2.75, -2},
      {true, 1, 1},
      {" 12.5 apples", 12.5, 12},
      {"+4", 4, 4},
      {"-.5e1", -5, 0},
      {"inf", 0, 0},
      {"0x10", 0, 0},
      {"", 0, 0},
      {"99999999999999999999", 1e20, largest},
      {"1e999 e-", std::numeric_limits<double>::max(), 1},
      {"1e-999", 0, 1},
      {"." + std::string(400, '0') + "1", 0, 0},
      {"1" + std::string(400, '0') + "e-5", std::numeric_limits<double>::max(), largest},
      {1e300, 1e300, largest},
      {std::numeric_limits<double>::infinity(), std::numeric_limits<double>::infinity(), largest},
      {PropertyDictionary(), 0, 0},
  };
  for (const auto& [value, timestamp, type] : cases) {
    const auto entry = KVQuarantineEntry::entryWithDictionary(
        {{"LSQuarantineTimeStamp", value}, {"LSQuarantineTypeNumber", value}});
    EXPECT_EQ(entry.timestamp(), timestamp);
    EXPECT_EQ(entry.type(), type);
  }
}

}  // namespace
}  // namespace Varnel
