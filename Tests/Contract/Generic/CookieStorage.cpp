// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Generic/SQLiteCookieStorage.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Platform::Contract {
namespace {

class CookieFiles final : public CookieStorageWorld {
 public:
  CookieStorage& port() override { return storage_; }
  void fillOwn(const std::vector<Cookie>& cookies) override { fill("own", cookies); }
  void fillGroup(const std::string& identifier, const std::vector<Cookie>& cookies) override {
    fill("group-containers/" + identifier, cookies);
  }

 private:
  void fill(const std::string& name, const std::vector<Cookie>& cookies) const {
    const std::string file = folder_.write(name + "/cookies.sqlite", "");
    auto database = SQLiteDatabase::open(file, SQLiteDatabase::Access::readWrite);
    ASSERT_TRUE(database);
    ASSERT_EQ(database->execute("CREATE TABLE moz_cookies (id INTEGER PRIMARY KEY, host TEXT,"
                                " path TEXT, name TEXT, value TEXT, expiry INTEGER)"),
              std::nullopt);
    for (const Cookie& cookie : cookies) {
      auto row = database->prepare(
          "INSERT INTO moz_cookies (host, path, name, value, expiry) VALUES (?, ?, ?, ?, "
          "4000000000)");
      ASSERT_TRUE(row);
      int column = 0;
      for (const std::string& text : {cookie.domain, cookie.path, cookie.name, cookie.value})
        row->bind(++column, text);
      ASSERT_TRUE(row->step());
    }
  }

  const Tests::TemporaryFolder folder_;
  Testing::SimulatedClock clock_;
  SQLiteCookieStorage storage_{folder_.path(), "own", clock_};
};
INSTANTIATE_TEST_SUITE_P(Generic, CookieStorageContract, on<CookieFiles>());

}  // namespace
}  // namespace Varnel::Platform::Contract
