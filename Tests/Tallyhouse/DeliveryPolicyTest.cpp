// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/DeliveryPolicy.h>

#include <gtest/gtest.h>

namespace Tallyhouse {
namespace {

using namespace std::chrono_literals;
using Varnel::Platform::Date;

const Date noon{std::chrono::hours(1'000'000)};

TEST(DeliveryPolicy, OnlyAnAnswerOfTheServerItselfSettlesABatch) {
  const std::pair<std::optional<int>, Verdict> cases[] = {
      {std::nullopt, Verdict::later}, {0, Verdict::later},       {100, Verdict::later},
      {200, Verdict::delivered},      {204, Verdict::delivered}, {302, Verdict::later},
      {400, Verdict::refused},        {404, Verdict::refused},   {407, Verdict::later},
      {408, Verdict::later},          {413, Verdict::refused},   {429, Verdict::later},
      {500, Verdict::later},          {503, Verdict::later},     {999, Verdict::later},
  };
  for (const auto& [status, verdict] : cases)
    EXPECT_EQ(DeliveryPolicy::verdict(status), verdict) << status.value_or(-1);
}

TEST(DeliveryPolicy, RetriesBackOffAndHeedTheServerWithinReason) {
  const DeliveryPolicy policy;
  using enum Obstacle;
  const struct {
    int failures;
    Obstacle obstacle;
    std::optional<std::chrono::seconds> retryAfter;
    double random;
    DeliveryPolicy::Duration delay;
  } cases[] = {
      {1, network, {}, 0, 5s},
      {4, network, {}, 0.5, 30s},
      {30, network, {}, 0, 1min},
      {1, server, {}, 0, 30min},
      {1, server, {}, 1, 15min},
      {2, server, {}, 0, 1h},
      {1'000'000, server, {}, 1, 1h},
      {1, server, 3600s, 0, 1h},
      {1, server, 3600s, 1, 2h},
      {1, server, 60s, 0.5, 22min + 30s},
      {1, server, std::chrono::seconds::max(), 1, 48h},
      {1, network, -5s, 0, 5s},
      {1, network, {}, 17, 2500ms},
  };
  for (const auto& c : cases)
    EXPECT_EQ(policy.retryDelay(c.failures, c.obstacle, c.retryAfter, c.random), c.delay)
        << c.failures << ' ' << c.random;
}

TEST(DeliveryPolicy, EventsWaitForCompanyButNotForAClockThatWasSetBack) {
  const DeliveryPolicy policy;
  struct Case {
    const char* what;
    Backlog backlog;
    std::optional<Date> notBefore;
    std::optional<Date> next;
  };
  const Backlog one{.waiting = 1, .oldest = noon - 2s, .refused = {}};
  const Backlog full{.waiting = 20, .oldest = noon, .refused = {}};
  const Backlog refused{.waiting = 0, .oldest = {}, .refused = noon - 1s};
  const Case cases[] = {
      {"nothing", {}, noon + 1h, {}},
      {"one event lingers", one, {}, noon + 3s},
      {"an event of tomorrow would otherwise wait for it", {1, noon + 24h, {}}, {}, noon},
      {"a full batch goes at once", full, {}, noon},
      {"one that was refused rests", refused, {}, noon + 1h - 1s},
      {"and holds up no other", {1, noon - 2s, noon - 1s}, {}, noon + 3s},
      {"but not until a day that was", {0, {}, noon + 24h}, {}, noon},
      {"unless the server is left alone", full, noon + 10min, noon + 10min},
      {"which may be over", one, noon - 1h, noon + 3s},
      {"or lie in a future that was", full, noon + 49h, noon},
  };
  for (const auto& c : cases)
    EXPECT_EQ(policy.nextSending(c.backlog, c.notBefore, noon), c.next) << c.what;
}

}  // namespace
}  // namespace Tallyhouse
