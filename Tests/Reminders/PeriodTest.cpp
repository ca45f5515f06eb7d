// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulePeriodOption.h>

#include <gtest/gtest.h>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Modules/VarnelModule.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>

namespace Varnel {
namespace {

using Object = Platform::PropertyDictionary;
using Kind = Basalt::JSONError::Kind;
using Option = SchedulePeriodOption;
using Box = SchedulePeriodOptionBox;

static_assert(Basalt::JSONObjectConvertable<Option>);
static_assert(Basalt::JSONConvertable<Box>);
static_assert(!std::is_default_constructible_v<Box>);
static_assert(!std::is_convertible_v<Basalt::JSON, Option>, "what may throw is asked for by name");

const Option productDefault = QNIsMarkettaVersion() ? Option::never : Option::onceInTwoWeeks;

TEST(SchedulePeriodOption, HasItsPublishedIdentities) {
  const struct {
    Option option;
    const char* kind;
    const char* analytics;
    const char* textKey;
    Platform::DateComponents interval;
  } rows[] = {
      {Option::never, "never", "Never", "Never", {.year = 1000}},
      {Option::weekly, "weekly", "Weekly", "Weekly", {.day = 7}},
      {Option::onceInTwoWeeks,
       "onceInTwoWeeks",
       "Once in Two Weeks",
       "Once In Two Weeks",
       {.day = 14}},
      {Option::monthly, "monthly", "Monthly", "Monthly", {.month = 1}},
      {Option::onceInThreeMonths,
       "onceInThreeMonths",
       "Once in Three Months",
       "Once In Three Months",
       {.month = 3}},
      {Option::onceInSixMonths,
       "onceInSixMonths",
       "Once in Six Months",
       "Once In Six Months",
       {.month = 6}},
      {Option::annually, "annually", "Annually", "Annually", {.year = 1}},
  };
  const Platform::Testing::FakeTimeZones zones;
  const Platform::Calendar gregorian("en_US", "UTC", zones);
  const auto module = std::make_shared<VarnelModule>();
  VarnelModule::setInstance(module);
  // Without texts the key stands for itself.
  module->setBundle(Bundle(std::nullopt, {}));
  std::int64_t raw = 0;
  for (const auto& row : rows) {
    EXPECT_EQ(Option::withRawValue(raw), row.option);
    EXPECT_EQ(Option::optionsAvailableToUser().at(static_cast<std::size_t>(raw)), row.option);
    EXPECT_EQ(std::hash<Option>{}(row.option), static_cast<std::size_t>(raw++));
    EXPECT_EQ(row.option.accessibilityIdentifier(), row.kind);
    EXPECT_EQ(row.option.analyticsIdentifier(), row.analytics);
    EXPECT_EQ(row.option.repeatInterval(gregorian), row.interval);
    EXPECT_EQ(row.option.exportJSONObject(), (Object{{"kind", row.kind}}));
    EXPECT_EQ(Option(Object{{"kind", row.kind}}), row.option);
    EXPECT_EQ(row.option.description(), row.textKey);
  }
  module->setBundle(Bundle(VARNEL_TEST_RESOURCES, {"de"}));
  EXPECT_EQ(Box(Option::annually).description(), "Jedes Jahr");
  VarnelModule::setInstance(nullptr);
  EXPECT_EQ(Option::withRawValue(7), std::nullopt);
  EXPECT_EQ(Option::withRawValue(-1), std::nullopt);
}

TEST(SchedulePeriodOption, ReadsDefaultAsWhatTheProductPrefers) {
  const Option read(Object{{"kind", "default"}});
  EXPECT_EQ(read, productDefault);
  EXPECT_EQ(read.exportJSON(), productDefault.exportJSON());
  EXPECT_EQ(Box::default_(), QNIsMarkettaVersion() ? Box::neverBox() : Box::onceInTwoWeeksBox());
}

// What a server or a damaged preference may hold; the box takes each for never.
TEST(SchedulePeriodOption, RefusesWhatIsNoPeriodAndTheBoxTakesItForNever) {
  const std::string deep = std::string(511, '[') + std::string(511, ']');
  const struct {
    std::string text;
    Kind kind;
    const char* path;
  } rows[] = {
      {R"({"kind": "Weekly"})", Kind::message, ""},
      {R"({"kind": "weekly "})", Kind::message, ""},
      {R"({"kind": "weekly\u0000"})", Kind::message, ""},
      {R"({"kind": ""})", Kind::message, ""},
      {R"({"kind": "never", "kind": 7})", Kind::typeMismatch, "kind"},
      {R"({"kind": null})", Kind::typeMismatch, "kind"},
      {R"({"kind": 1e308})", Kind::typeMismatch, "kind"},
      {R"({"kind": 123456789012345678901234567890})", Kind::typeMismatch, "kind"},
      {R"({"kind": )" + deep + "}", Kind::typeMismatch, "kind"},
      {R"({"Kind": "weekly"})", Kind::missingValue, "kind"},
      {"{}", Kind::missingValue, "kind"},
      {R"("weekly")", Kind::typeMismatch, "root"},
      {deep, Kind::typeMismatch, "root"},
      {"null", Kind::typeMismatch, "root"},
  };
  for (const auto& row : rows) {
    const Basalt::JSON value = Basalt::parseJSON(row.text);
    try {
      const Option option(value);
      FAIL() << row.text.substr(0, 40);
    } catch (const Basalt::JSONError& error) {
      EXPECT_EQ(error.kind(), row.kind) << row.text.substr(0, 40);
      EXPECT_EQ(error.path(), row.path) << row.text.substr(0, 40);
    }
    EXPECT_EQ(Box(value).boxed(), Option::never);
  }
  const Basalt::JSON brokenText = Object{{"kind", "week\xffly"}};
  try {
    const Option option(brokenText);
    FAIL();
  } catch (const Basalt::JSONError& error) {
    EXPECT_STREQ(error.what(), "Unable to import SchedulePeriodOption of kind week\xffly");
  }
}

TEST(SchedulePeriodOptionBox, IsAValueInAnObject) {
  const auto one = Box::make(Option::monthly);
  EXPECT_EQ(*one, *Box::monthlyBox());
  EXPECT_NE(*one, *Box::weeklyBox());
  EXPECT_NE(one, Box::monthlyBox());
  EXPECT_EQ(Box::monthlyBox(), Box::monthlyBox());
  EXPECT_EQ(one->hash(), Box::monthlyBox()->hash());
  EXPECT_EQ(one->copy(), one);
  EXPECT_EQ(one->exportJSON(), (Object{{"kind", "monthly"}}));
  EXPECT_EQ(Box(Object{{"kind", "annually"}}).value(), 6);

  const auto& all = Box::optionsAvailableToUser();
  EXPECT_EQ(&all, &Box::optionsAvailableToUser());
  ASSERT_EQ(all.size(), 7u);
  for (std::size_t i = 0; i < all.size(); ++i)
    EXPECT_EQ(all[i]->boxed(), Option::optionsAvailableToUser().at(i));
}

}  // namespace
}  // namespace Varnel
