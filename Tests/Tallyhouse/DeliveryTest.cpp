// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/Delivery.h>

#include <filesystem>
#include <map>
#include <vector>

#include <Tests/Tallyhouse/SpoolFixture.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>

namespace Tallyhouse {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Varnel::Platform::Date;
using Varnel::Platform::HTTPFailure;
using Varnel::Platform::HTTPPost;
using Varnel::Platform::HTTPResponse;

// A server that keeps the UUID of each event that it sees.
class Server {
 public:
  using Answer = Varnel::Platform::Testing::FakeHTTPClient::Answer;

  static std::vector<std::string> uuidsIn(const std::string& body) {
    std::vector<std::string> uuids;
    for (std::size_t at = body.find("&z="); at != std::string::npos; at = body.find("&z=", at + 1))
      uuids.push_back(body.substr(at + 3, body.find('\n', at) - at - 3));
    return uuids;
  }

  Answer take(const HTTPPost& post) {
    for (const std::string& uuid : uuidsIn(post.body)) ++timesSeen[uuid];
    return HTTPResponse{.status = 200, .retryAfter = {}};
  }

  std::map<std::string, int> timesSeen;
};

class DeliveryTest : public Tests::SpoolFixture {
 protected:
  // A process that delivers.
  struct Process {
    explicit Process(DeliveryTest& test)
        : spool(test.openSpool()),
          delivery({test.clock, test.http}, *spool, {.url = "https://h.example/batch"}, {},
                   [] { return 0.5; }) {}
    Delivery::State step(Delivery::Haste haste = Delivery::Haste::none) {
      return delivery.step(haste, {}).state;
    }

    std::unique_ptr<EventSpool> spool;
    Delivery delivery;
  };

  // Takes steps when they are due until nothing is left, or the time is over.
  void run(std::chrono::hours longest) {
    Process process(*this);
    const Date end = clock.now() + longest;
    while (const auto next = process.delivery.step(Delivery::Haste::usual, {}).next) {
      if (*next > end) return;
      clock.set(std::max(*next, clock.now()));
    }
  }

  void append(int count) {
    const auto recorder = openRecorder();
    for (int i = 0; i < count; ++i)
      recorder->append("U" + std::to_string(i), clock.now(), "ea=" + std::to_string(i));
  }

  Varnel::Platform::Testing::FakeHTTPClient http;
  Server server;
};

TEST_F(DeliveryTest, AWeekOfOutagesLosesNothing) {
  const Date start = clock.now();
  append(95);
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    const auto passed = clock.now() - start;
    if (passed < 10min) return HTTPFailure{.message = "no route", .isOffline = true};
    if (passed < 1h) return HTTPResponse{.status = 503, .retryAfter = 1800s};
    if (passed < 24h * 7) return HTTPResponse{.status = 302, .retryAfter = {}};
    return server.take(post);
  });
  run(24h * 8);
  EXPECT_EQ(server.timesSeen.size(), 95u);
  for (const auto& [uuid, times] : server.timesSeen) EXPECT_EQ(times, 1) << uuid;
  EXPECT_EQ(names(), "");
  // Some ten tries to the longest delay, then one every hour or two.
  EXPECT_LT(http.posts().size(), 140u);
  EXPECT_NE(http.posts().back().body.find("&qt=6"), std::string::npos) << "the age is told";
}

TEST_F(DeliveryTest, ATimeOfflineEndsWithinAMinuteAndIsNotTheServersFault) {
  append(20);
  int offline = 0;
  std::vector<Date> reached;
  http.setServer([&, start = clock.now()](const HTTPPost&) -> Server::Answer {
    if (clock.now() - start < 1h) {
      ++offline;
      return HTTPFailure{.message = "no route", .isOffline = true};
    }
    reached.push_back(clock.now());
    return HTTPResponse{.status = 503, .retryAfter = {}};
  });
  const Date end = clock.now() + 1h;
  run(3h);
  EXPECT_GE(offline, 60);
  ASSERT_GE(reached.size(), 2u);
  EXPECT_LE(reached[0] - end, 1min);
  EXPECT_LE(reached[1] - reached[0], 30min);
}

TEST_F(DeliveryTest, OneBadEventIsSetAsideAndHoldsUpNoOther) {
  append(45);
  std::vector<std::pair<std::size_t, Date>> bad;
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    const auto uuids = Server::uuidsIn(post.body);
    if (std::find(uuids.begin(), uuids.end(), "U7") == uuids.end()) return server.take(post);
    bad.emplace_back(uuids.size(), clock.now());
    return HTTPResponse{.status = 400, .retryAfter = {}};
  });
  run(24h);
  EXPECT_EQ(server.timesSeen.size(), 44u);
  ASSERT_EQ(bad.size(), 3u);
  EXPECT_EQ(bad[0].first + bad[1].first + bad[2].first, 22u);
  EXPECT_GE(bad[1].second - bad[0].second, 1h) << "a server has time to be mended";
  EXPECT_GE(bad[2].second - bad[1].second, 1h);
  append(1);
  run(24h);
  EXPECT_EQ(bad.size(), 3u) << "it is not tried again";
}

TEST_F(DeliveryTest, WhatArrivedButCannotBeNotedIsNotRepeated) {
  append(20);
  Process process(*this);
  Process other(*this);
  std::optional<Tests::OtherConnection> lock;
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    lock.emplace(path(), "BEGIN IMMEDIATE");
    return server.take(post);
  });
  for (int i = 0; i < 3; ++i) EXPECT_EQ(process.step(), Delivery::State::fileAway);
  EXPECT_EQ(other.step(), Delivery::State::elsewhere);
  lock.reset();
  EXPECT_EQ(process.step(), Delivery::State::idle);
  EXPECT_EQ(http.posts().size(), 1u);
  EXPECT_EQ(names(), "");
  append(20);
  EXPECT_EQ(process.step(), Delivery::State::fileAway);
  lock.reset();
  process.delivery.finish();
  EXPECT_EQ(names(), "") << "nor by the next run";
}

TEST_F(DeliveryTest, ALockThatNobodyCanTakeIsSaidOnce) {
  append(20);
  const std::string lock = path() + ".deliverer";
  const auto makers = {+[](const std::string& at) { fs::create_directory(at); },
                       +[](const std::string& at) { fs::create_symlink("elsewhere", at); }};
  for (const auto make : makers) {
    make(lock);
    Process process(*this);
    const std::size_t before = log.text().size();
    for (int i = 0; i < 2; ++i) EXPECT_EQ(process.step(), Delivery::State::fileAway);
    const std::string said = log.text().substr(before);
    EXPECT_NE(said.find(lock), std::string::npos) << said;
    EXPECT_EQ(std::count(said.begin(), said.end(), '\n'), 1) << said;
    fs::remove(lock);
  }
  EXPECT_EQ(Process(*this).step(), Delivery::State::idle);
}

TEST_F(DeliveryTest, AWaitForTheFileIsShortAgainAfterALongOne) {
  const std::string lock = path() + ".deliverer";
  Process process(*this);
  for (const int tries : {20, 1}) {
    append(20);
    fs::remove(lock);
    fs::create_directory(lock);
    Date next;
    for (int i = 0; i < tries; ++i, clock.advance(1min))
      next = process.delivery.step(Delivery::Haste::none, {}).next.value();
    EXPECT_EQ(next < clock.now() - 1min + 1s, tries == 1);
    fs::remove(lock);
    EXPECT_EQ(process.step(), Delivery::State::idle);
  }
}

TEST_F(DeliveryTest, ThePauseThatAServerAsksForOutlivesTheProcess) {
  append(20);
  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 429, .retryAfter = 3600s}; });
  EXPECT_EQ(Process(*this).step(), Delivery::State::later);
  for (int run = 0; run < 3; ++run) {
    append(20);
    clock.advance(10min);
    EXPECT_EQ(Process(*this).step(), Delivery::State::later);
  }
  EXPECT_EQ(http.posts().size(), 1u);
  clock.advance(1h);
  EXPECT_EQ(Process(*this).step(), Delivery::State::later);
  EXPECT_EQ(http.posts().size(), 2u);
  EXPECT_EQ(openSpool()->look("https://h.example/batch", 1, 3)->state.failures, 2);
  EXPECT_FALSE(openSpool()->look("https://other.example", 1, 3)->state.notBefore);
}

TEST_F(DeliveryTest, AfterAStopNothingIsSent) {
  append(20);
  Process process(*this);
  std::stop_source stop;
  stop.request_stop();
  EXPECT_TRUE(process.delivery.step(Delivery::Haste::none, stop.get_token()).next);
  EXPECT_TRUE(http.posts().empty());
  // A post that was interrupted does not count as a failure.
  std::stop_source later;
  http.setServer([&](const HTTPPost&) -> Server::Answer {
    later.request_stop();
    return HTTPFailure{"cancelled"};
  });
  EXPECT_EQ(process.delivery.step(Delivery::Haste::none, later.get_token()).state,
            Delivery::State::due);
  EXPECT_EQ(process.spool->look("https://h.example/batch", 1, 3)->state.failures, 0);
  EXPECT_EQ(Process(*this).step(), Delivery::State::later) << "others may deliver";
}

}  // namespace
}  // namespace Tallyhouse
