// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <filesystem>
#include <limits>
#include <string>

#include <Varnel/Platform/Testing/FakeApplicationStorage.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

constexpr const char* identifier = "com.example.App";

TEST_P(UserDefaultsContract, KeepsEveryValueForAllProcesses) {
  UserDefaults& defaults = world->port().userDefaults(identifier);
  const UserDefaults& another = world->storageOfAnother().userDefaults(identifier);
  int row = 0;
  for (const std::string& text :
       {""s, "   "s, " two\r\n\tlines; \\s ünïcode "s, "[a]=#b"s, std::string(400'000, 'x')}) {
    const std::string key = "a [key] = with / odd \n characters" + std::to_string(++row);
    EXPECT_EQ(another.text(key), std::nullopt);
    EXPECT_EQ(defaults.set(key, text), std::nullopt);
    EXPECT_EQ(another.text(key), text);
  }
  for (const bool value : {true, false}) {
    EXPECT_EQ(defaults.set("key", value), std::nullopt);
    EXPECT_EQ(another.truthValue("key"), value);
  }
  using Integer = std::numeric_limits<std::int64_t>;
  for (const std::int64_t value :
       {Integer::min(), std::int64_t{-9007199254740993}, Integer::max()}) {
    EXPECT_EQ(defaults.set("key", value), std::nullopt);
    EXPECT_EQ(another.integer("key"), value);
  }
  using Real = std::numeric_limits<double>;
  for (const double value : {0.1, -1e300, Real::denorm_min(), Real::max(), Real::infinity()}) {
    EXPECT_EQ(defaults.set("key", value), std::nullopt);
    EXPECT_EQ(another.real("key"), value);
  }
  EXPECT_EQ(defaults.remove("key"), std::nullopt);
  EXPECT_EQ(another.text("key"), std::nullopt);
  EXPECT_EQ(defaults.remove("key"), std::nullopt);
}

TEST_P(UserDefaultsContract, ReadsAValueAsEachTypeThatItSpells) {
  const struct {
    UserDefaults::Value value;
    std::string text;
    std::optional<bool> truth;
    std::optional<std::int64_t> integer;
    std::optional<double> real;
  } rows[] = {
      {true, "true", true, {}, {}},
      {false, "false", false, {}, {}},
      {std::int64_t{1}, "1", true, 1, 1.0},
      {std::int64_t{0}, "0", false, 0, 0.0},
      {std::int64_t{-3}, "-3", {}, -3, -3.0},
      {3.0, "3", {}, 3, 3.0},
      {0.1, "0.1", {}, {}, 0.1},
      {" true "s, " true ", true, {}, {}},
      {" 12 "s, " 12 ", {}, 12, 12.0},
      {"99999999999999999999"s, "99999999999999999999", {}, {}, 1e20},
      {"12 apples"s, "12 apples", {}, {}, {}},
      {"1e999"s, "1e999", {}, {}, {}},
      {"yes"s, "yes", {}, {}, {}},
      {""s, "", {}, {}, {}},
  };
  UserDefaults& defaults = world->port().userDefaults(identifier);
  for (const auto& row : rows) {
    EXPECT_EQ(defaults.set("key", row.value), std::nullopt);
    EXPECT_EQ(defaults.text("key"), row.text);
    EXPECT_EQ(defaults.truthValue("key"), row.truth) << row.text;
    EXPECT_EQ(defaults.integer("key"), row.integer) << row.text;
    EXPECT_EQ(defaults.real("key"), row.real) << row.text;
  }
}

TEST_P(UserDefaultsContract, RefusesWhatItCannotKeepAndLosesNothing) {
  UserDefaults& defaults = world->port().userDefaults(identifier);
  const auto isRefused = [](const std::optional<PlatformError>& error, std::errc reason) {
    return error && error->code() == static_cast<int>(reason);
  };
  EXPECT_EQ(defaults.set("key", "kept"s), std::nullopt);
  for (const std::string& wrong : {""s, "a\0b"s, "\xFF"s}) {
    EXPECT_TRUE(isRefused(defaults.set(wrong, true), std::errc::invalid_argument));
    EXPECT_TRUE(isRefused(defaults.remove(wrong), std::errc::invalid_argument));
    EXPECT_EQ(defaults.text(wrong), std::nullopt);
  }
  for (const std::string& wrong : {"a\0b"s, "\xFF"s})
    EXPECT_TRUE(isRefused(defaults.set("key", wrong), std::errc::invalid_argument));
  EXPECT_TRUE(isRefused(defaults.set("key", std::string(2 << 20, 'x')), std::errc::file_too_large));
  EXPECT_EQ(defaults.text("key"), "kept");
  for (int i = 0; i < 2; ++i)
    EXPECT_EQ(defaults.set("key", std::string(600'000, 'x')), std::nullopt) << "in its own place";
  EXPECT_EQ(defaults.set("key", "new"s), std::nullopt);
  EXPECT_EQ(defaults.text("key"), "new");
}

TEST_P(UserDefaultsContract, EachIdentifierHasItsOwnBelowTheUsersFolders) {
  ApplicationStorage& storage = world->port();
  UserDefaults& one = storage.userDefaults("com.a.One");
  EXPECT_EQ(&storage.userDefaults("com.a.One"), &one);
  EXPECT_EQ(one.set("key", true), std::nullopt);
  EXPECT_EQ(storage.userDefaults("com.a.Two").text("key"), std::nullopt);
  EXPECT_NE(storage.settingsPath("com.a.One"), storage.settingsPath("com.a.Two"));
  EXPECT_NE(storage.analyticsSpoolPath("com.a.One"), storage.analyticsSpoolPath("com.a.Two"));
  EXPECT_EQ(storage.analyticsSpoolPath("com.a.One"),
            world->storageOfAnother().analyticsSpoolPath("com.a.One"));
  namespace fs = std::filesystem;
  const fs::path usual = storage.analyticsSpoolPath("com.a.One");
  EXPECT_TRUE(usual.is_absolute());
  for (const std::string& odd : {""s, "."s, ".."s, "/"s, "../x"s, "a/../../b"s, "a\0b"s}) {
    EXPECT_EQ(storage.userDefaults(odd).set("key", true), std::nullopt);
    const fs::path path = storage.analyticsSpoolPath(odd);
    EXPECT_EQ(path.parent_path().parent_path(), usual.parent_path().parent_path()) << path;
    EXPECT_EQ(path.lexically_normal(), path);
    EXPECT_EQ(path.native().find('\0'), std::string::npos);
  }
}

class FakeUserDefaultsWorld final : public UserDefaultsWorld {
 public:
  ApplicationStorage& port() override { return storage_; }
  ApplicationStorage& storageOfAnother() override { return storage_; }

 private:
  Testing::FakeApplicationStorage storage_{"/home/ada"};
};
INSTANTIATE_TEST_SUITE_P(Fake, UserDefaultsContract, on<FakeUserDefaultsWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
