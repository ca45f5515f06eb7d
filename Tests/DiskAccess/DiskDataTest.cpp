// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskData.h>

#include <gtest/gtest.h>

#include <limits>
#include <memory>
#include <optional>
#include <vector>

#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/DiskAccess/WaitingDeadline.h>

namespace Varnel {
namespace {

using Basalt::ThreadID;
using Platform::Date;
using QoS = Platform::QualityOfService;

constexpr auto first = static_cast<ThreadID>(1'000'001);
constexpr auto second = static_cast<ThreadID>(1'000'002);
constexpr auto third = static_cast<ThreadID>(1'000'003);

bool isSignalled(DiskData::AccessRequest& request) {
  return request.sema.waitUntil(Date());
}

/// A disk whose threads are numbers and wait for nothing.
class DiskDataTest : public ::testing::Test {
 protected:
  std::shared_ptr<DiskData> disk(OVDiskKind kind) {
    return std::make_shared<DiskData>(
        std::make_shared<OVDiskInfo>("disk", OVDiskInfo::VolumeURLs(), kind), false, queue_);
  }
  auto request(DiskData& data, ThreadID thread, QoS qos = QoS::utility) {
    return queue_->sync([&] { return data.requestAccess(thread, qos); });
  }
  void release(DiskData& data, ThreadID thread) {
    queue_->sync([&] { data.releaseAccess(thread); });
  }

  const std::shared_ptr<Basalt::SerialQueue> queue_ =
      std::make_shared<Basalt::SerialQueue>("test.planning-queue");
};

TEST_F(DiskDataTest, AdmitsAsManyThreadsAsTheDiskBears) {
  const std::pair<OVDiskKind, int> cases[] = {
      {OVDiskKindUnknown, 1},          {OVDiskKindSolidState, 4}, {OVDiskKindRotational, 2},
      {OVDiskKindNetwork, 1},          {OVDiskKindExternal, 1},   {static_cast<OVDiskKind>(7), 7},
      {static_cast<OVDiskKind>(-1), 0}};
  for (const auto& [kind, limit] : cases) {
    const auto data = disk(kind);
    int admitted = 0;
    while (admitted < 10 && !request(*data, static_cast<ThreadID>(1'000'000 + admitted)))
      ++admitted;
    EXPECT_EQ(admitted, limit);
  }
}

TEST_F(DiskDataTest, GrantsByClassAndWithinAClassInOrder) {
  const auto data = disk(OVDiskKindUnknown);
  EXPECT_FALSE(request(*data, first));
  // In the order of their coming, with the place that each should get.
  const std::pair<QoS, std::size_t> cases[] = {
      {QoS::background, 7}, {QoS::utility, 5},           {QoS::default_, 2},
      {QoS::background, 8}, {QoS::userInteractive, 0},   {QoS::userInitiated, 3},
      {QoS::default_, 4},   {static_cast<QoS>(0x15), 1}, {QoS::utility, 6}};
  std::vector<std::shared_ptr<DiskData::AccessRequest>> expected(std::size(cases));
  for (const auto& [qos, place] : cases) expected[place] = request(*data, second, qos);
  const auto granted = queue_->sync([&] { return data->claimPendingRequests(); });
  EXPECT_EQ(std::vector(granted.begin(), granted.end()), expected);
}

TEST_F(DiskDataTest, OneFreePlaceWakesEveryWaiter) {
  const auto data = disk(OVDiskKindRotational);
  EXPECT_FALSE(request(*data, first));
  EXPECT_FALSE(request(*data, second));
  std::vector<std::shared_ptr<DiskData::AccessRequest>> waiting;
  for (int i = 0; i < 5; ++i) waiting.push_back(request(*data, third));
  EXPECT_TRUE(waiting[2]->claim()) << "its thread gives up";
  release(*data, first);
  for (std::size_t i = 0; i < 5; ++i) EXPECT_EQ(isSignalled(*waiting[i]), i != 2) << i;
  for (int i = 0; i < 4; ++i) queue_->sync([&] { data->confirmAccess(third); });
  EXPECT_EQ(data->accessCount(), 5u);

  // The disk is fuller than it should be; nobody comes in before that is over.
  const auto late = request(*data, first);
  ASSERT_TRUE(late);
  for (int i = 0; i < 3; ++i) release(*data, third);
  EXPECT_FALSE(isSignalled(*late));
  release(*data, second);
  EXPECT_TRUE(isSignalled(*late));
}

TEST_F(DiskDataTest, GrantsAfterWhatWasSubmittedBeforeTheRelease) {
  const auto data = disk(OVDiskKindRotational);
  EXPECT_FALSE(request(*data, first));
  EXPECT_FALSE(request(*data, second));
  const auto waiting = request(*data, third);
  queue_->sync([&] {
    queue_->submit([&] { data->setIsBackgroundMode(true); });
    data->releaseAccess(first);
  });
  EXPECT_FALSE(isSignalled(*waiting)) << "the one place of background mode is taken";
  release(*data, second);
  EXPECT_TRUE(isSignalled(*waiting));
}

TEST_F(DiskDataTest, ThreadsThatGiveUpDoNotPileUp) {
  const auto data = disk(OVDiskKindUnknown);
  EXPECT_FALSE(request(*data, first));
  const auto patient = request(*data, second, QoS::background);
  for (int i = 0; i < 1000; ++i) EXPECT_TRUE(request(*data, third)->claim());
  EXPECT_LT(data->requestCount(), 10u);
  release(*data, first);
  EXPECT_TRUE(isSignalled(*patient));
}

TEST(WaitingDeadline, KeepsToTheCalendar) {
  using std::chrono::microseconds;
  constexpr double infinity = std::numeric_limits<double>::infinity();
  const Date now = std::chrono::sys_days(std::chrono::year(2026) / 3 / 14);
  const std::pair<std::optional<double>, Date> cases[] = {
      {std::nullopt, Date::max()},
      {0, now},
      {-1, now},
      {-infinity, now},
      {1.5, now + microseconds(1'500'000)},
      {1e10, now + microseconds(10'000'000'000'000'000)},
      {1e13, Date::max()},
      {1e300, Date::max()},
      {infinity, Date::max()},
      {std::numeric_limits<double>::quiet_NaN(), Date::max()}};
  for (const auto& [timeout, deadline] : cases)
    EXPECT_EQ(waitingDeadline(now, timeout), deadline) << timeout.value_or(-99);
}

}  // namespace
}  // namespace Varnel
