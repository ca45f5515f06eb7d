// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/AnalyticsTracker.h>

#include <string>

#include <Varnel/Tallyhouse/AnalyticsTransport.h>
#include <gtest/gtest.h>

namespace Tallyhouse {
namespace {

// Writes down what it is told.
class Witness final : public AnalyticsTransport {
 public:
  void start() noexcept override { told += "start "; }
  void accept(const AnalyticsEvent& event) noexcept override { told += event.action + " "; }
  void discardAll() noexcept override { told += "discard "; }

  std::string told;
};

void track(AnalyticsTracker& tracker, const char* action) {
  tracker.context()->trackEvent("Category", action, std::nullopt, std::nullopt, {}, {});
}

TEST(AnalyticsConsent, LetsEventsThroughOnlyOnceGranted) {
  const struct {
    Consent first;
    Consent next;
    const char* told;
  } rows[] = {
      {Consent::notAsked, Consent::granted, "start second "},
      {Consent::notAsked, Consent::refused, "discard "},
      {Consent::refused, Consent::granted, "discard start second "},
      {Consent::granted, Consent::refused, "start first discard "},
      {Consent::granted, Consent::notAsked, "start first discard "},
  };
  for (const auto& row : rows) {
    const auto witness = std::make_shared<Witness>();
    AnalyticsTracker tracker(witness, row.first);
    track(tracker, "first");
    tracker.context()->setConsent(row.next);
    EXPECT_EQ(tracker.context()->consent(), row.next);
    track(tracker, "second");
    EXPECT_EQ(witness->told, row.told) << &row - rows;
  }
}

TEST(AnalyticsConsent, IsNotAskedUntilTheHostSaysMore) {
  const auto witness = std::make_shared<Witness>();
  AnalyticsTracker tracker(witness);
  track(tracker, "event");
  EXPECT_EQ(tracker.context()->consent(), Consent::notAsked);
  EXPECT_EQ(witness->told, "");
}

}  // namespace
}  // namespace Tallyhouse
