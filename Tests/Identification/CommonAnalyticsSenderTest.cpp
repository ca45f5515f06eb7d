// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Analytics/CommonAnalyticsSender.h>

#include <latch>
#include <limits>
#include <thread>

#include <Tests/Logging/LoggerFixture.h>
#include <Varnel/Identification/Analytics/CustomDimensionValues.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>
#include <Varnel/Identification/Analytics/FoundValue.h>
#include <Varnel/Platform/Testing/FakeWorkspace.h>
#include <Varnel/Provenance/OVFriendsLocator.h>
#include <Varnel/Tallyhouse/Testing/MemoryTransport.h>
#include <gtest/gtest.h>

namespace Varnel {
namespace {

using Basalt::RouterActionSenderKind;
using Tallyhouse::CustomDimensions;

class ScannerSender final : public CommonAnalyticsSender {
 public:
  ScannerSender(std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker, Logger& logger)
      : CommonAnalyticsSender(std::move(tracker)), logger_(logger) {}
  Logger& logger() const override { return logger_; }
  std::string contextName() const override { return "Scanner"; }

 private:
  Logger& logger_;
};

class CommonAnalyticsSenderTest : public Tests::LoggerFixture {
 protected:
  CommonAnalyticsSenderTest() {
    const auto workspace = std::make_shared<Platform::Testing::FakeWorkspace>();
    for (const char* sibling : {"com.quennel.Kelvane2", "com.quennel.trial.Velt2"})
      workspace->applications.emplace(sibling, Platform::URL::fileURLWithPath("/opt/sibling"));
    OVFriendsLocator::sharedLocator().setWorkspace(workspace);
    CustomDimensionsHolder::setClientIdentifier("12.34");
    CustomDimensionsHolder::setDownloadSourceURL(std::nullopt);
    CustomDimensionsHolder::setScanCount(3);
  }

  std::string lastEntry() const {
    const std::string text = fakes.standardOutput.text();
    const std::size_t begin = text.rfind("] ");
    return begin == std::string::npos ? text : text.substr(begin + 2);
  }

  std::shared_ptr<Tallyhouse::Testing::MemoryTransport> sent_ =
      std::make_shared<Tallyhouse::Testing::MemoryTransport>();
  std::shared_ptr<Tallyhouse::AnalyticsTracker> tracker_ =
      std::make_shared<Tallyhouse::AnalyticsTracker>(sent_, Tallyhouse::Consent::granted);
  ScannerSender sender_{tracker_, logger()};
};

TEST(FoundValue, MakesNobodyWaitThatHasAnother) {
  FoundValue<int> value;
  std::latch looks(1);
  std::latch finds(1);
  std::thread first([&] {
    const int found = value.get([&] {
      looks.count_down();
      finds.wait();
      return 1;
    });
    EXPECT_EQ(found, 2);
  });
  looks.wait();
  value.set(2);
  EXPECT_EQ(value.get([] { return 3; }), 2);
  finds.count_down();
  first.join();
}

TEST_F(CommonAnalyticsSenderTest, EmptyDimensionsStandForTheHoldersAndOthersForThemselves) {
  const CustomDimensions eight = {"12.34", std::nullopt, "0.0", "3", "0", "0", "1000001", "null"};
  sender_.trackCustomEvent("Scan", "Finished", "Pictures", 12);
  sender_.trackEvent("Stop", std::nullopt, std::nullopt, {}, {7});
  sender_.trackEvent("Close", RouterActionSenderKind::menuItem, 1, {"own"});

  const auto events = sent_->events();
  ASSERT_EQ(events.size(), 3u);
  EXPECT_EQ(events[0].category, "Scan");
  EXPECT_EQ(events[0].label, "Pictures");
  EXPECT_EQ(events[0].value, 12);
  EXPECT_EQ(events[0].customDimensions, eight);
  EXPECT_EQ(events[1].category, "Scanner");
  EXPECT_EQ(events[1].label, std::nullopt);
  EXPECT_EQ(events[1].customDimensions, eight);
  EXPECT_EQ(events[1].customMetrics, Tallyhouse::CustomMetrics{7});
  EXPECT_EQ(events[2].label, "Menu Item");
  EXPECT_EQ(events[2].customDimensions, CustomDimensions{"own"});
  EXPECT_NE(events[0].uuid, events[1].uuid);
}

TEST_F(CommonAnalyticsSenderTest, EchoesToTheLetterWhileTheTrackerPrints) {
  const std::string before = fakes.standardOutput.text();
  sender_.trackCustomEvent("Scan", "Quiet", "", 0);
  EXPECT_EQ(fakes.standardOutput.text(), before);
  EXPECT_EQ(sent_->events().size(), 1u);

  tracker_->setShouldPrintEvents(true);
  sender_.trackCustomEvent("Scan", "Go", "a", -1, {"say \"\\\n\"\x1B", std::nullopt, "{}"}, {});
  EXPECT_EQ(lastEntry(),
            "CommonAnalyticsSender:  Category: `Scan` Action: `Go` Label: `a` Value: `-1` "
            "CustomDimensions: [Optional(\"say \\\"\\\\\\n\\\"\\x1B\"), nil, Optional(\"{}\")]\n");
  sender_.trackEvent("Go", std::nullopt, std::nullopt, {std::nullopt}, {});
  EXPECT_EQ(lastEntry(),
            "CommonAnalyticsSender:  Category: `Scanner` Action: `Go` Label: `nil` Value: `nil` "
            "CustomDimensions: [nil]\n");
}

TEST(CustomDimensionValues, AchievementsAreTheCeilingOfTheProductAsComputed) {
  const std::pair<double, const char*> cases[] = {
      {0, "0.0"},
      {0.123, "13.0"},
      {1, "100.0"},
      {0.07, "8.0"},
      {-0.005, "-0.0"},
      {1e15, "1e+17"},
      {12345, "1234500.0"},
      {std::numeric_limits<double>::infinity(), "inf"},
      {-std::numeric_limits<double>::infinity(), "-inf"},
      {-std::numeric_limits<double>::quiet_NaN(), "nan"},
  };
  for (const auto& [fraction, text] : cases) {
    CustomDimensionValues values;
    values.achievementsFractionCompleted = fraction;
    EXPECT_EQ(values.customDimensions()[2], text) << fraction;
  }
}

}  // namespace
}  // namespace Varnel
