// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/Delivery.h>

#include <map>
#include <vector>

#include <Tests/Tallyhouse/SpoolFixture.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>

namespace Tallyhouse {
namespace {

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
  // Takes steps when they are due until nothing is left, or the time is over.
  void run(std::chrono::hours longest) {
    const Date end = clock.now() + longest;
    while (const auto next = delivery.step(Delivery::Haste::usual, {})) {
      if (*next > end) return;
      clock.set(std::max(*next, clock.now()));
    }
  }

  void append(int count) {
    for (int i = 0; i < count; ++i)
      spool->append("U" + std::to_string(i), clock.now(), "ea=" + std::to_string(i));
  }

  Varnel::Platform::Testing::FakeHTTPClient http;
  Server server;
  std::unique_ptr<EventSpool> spool = openSpool();
  Delivery delivery{
      {clock, http}, *spool, {.url = "https://h.example/batch"}, {}, [] { return 0.5; }};
};

TEST_F(DeliveryTest, AWeekOfOutagesLosesNothing) {
  const Date start = clock.now();
  append(95);
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    const auto passed = clock.now() - start;
    if (passed < 10min) return HTTPFailure{"no route"};
    if (passed < 1h) return HTTPResponse{.status = 503, .retryAfter = 1800s};
    if (passed < 24h * 7) return HTTPResponse{.status = 302, .retryAfter = {}};
    return server.take(post);
  });
  run(24h * 8);
  EXPECT_EQ(server.timesSeen.size(), 95u);
  for (const auto& [uuid, times] : server.timesSeen) EXPECT_EQ(times, 1) << uuid;
  EXPECT_EQ(namesOf(*spool), "");
  // Some ten tries to the longest delay, then one or two an hour.
  EXPECT_LT(http.posts().size(), 260u);
  EXPECT_NE(http.posts().back().body.find("&qt=6"), std::string::npos) << "the age is told";
}

TEST_F(DeliveryTest, WhatGotLostOnTheWayBackIsRepeatedUnderTheSameName) {
  append(30);
  int answers = 0;
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    const auto answer = server.take(post);
    return ++answers % 2 ? Server::Answer(HTTPFailure{"cut"}) : answer;
  });
  run(24h);
  EXPECT_EQ(server.timesSeen.size(), 30u);
  EXPECT_EQ(namesOf(*spool), "");
}

TEST_F(DeliveryTest, OneBadEventIsSetAsideAndHoldsUpNoOther) {
  append(45);
  std::vector<std::size_t> badBatches;
  http.setServer([&](const HTTPPost& post) -> Server::Answer {
    const auto uuids = Server::uuidsIn(post.body);
    if (std::find(uuids.begin(), uuids.end(), "U7") == uuids.end()) return server.take(post);
    badBatches.push_back(uuids.size());
    return HTTPResponse{.status = 400, .retryAfter = {}};
  });
  run(1h);
  EXPECT_EQ(server.timesSeen.size(), 44u);
  EXPECT_EQ(badBatches, (std::vector<std::size_t>{20, 1, 1}));
  append(1);
  run(1h);
  EXPECT_EQ(badBatches.size(), 3u) << "it is not tried again";
}

TEST_F(DeliveryTest, AServerThatRefusesEverythingIsNotHammered) {
  append(100);
  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 404, .retryAfter = {}}; });
  run(24h);
  EXPECT_LT(http.posts().size(), 60u);
}

TEST_F(DeliveryTest, WhatArrivedButCannotBeRemovedIsNotRepeatedAtOnce) {
  append(20);
  using Database = Varnel::Platform::SQLiteDatabase;
  auto other = Database::open(path(), Database::Access::readWrite);
  ASSERT_FALSE(other->execute("BEGIN IMMEDIATE"));
  EXPECT_GT(delivery.step(Delivery::Haste::none, {}), clock.now());
  ASSERT_FALSE(other->execute("ROLLBACK"));
  run(1h);
  EXPECT_EQ(http.posts().size(), 2u);
  EXPECT_EQ(namesOf(*spool), "");
}

TEST_F(DeliveryTest, AfterAStopNothingIsSent) {
  append(20);
  std::stop_source stop;
  stop.request_stop();
  EXPECT_TRUE(delivery.step(Delivery::Haste::none, stop.get_token()));
  EXPECT_TRUE(http.posts().empty());
  // A post that was interrupted does not count as a failure.
  std::stop_source later;
  http.setServer([&](const HTTPPost&) -> Server::Answer {
    later.request_stop();
    return HTTPFailure{"cancelled"};
  });
  EXPECT_LE(delivery.step(Delivery::Haste::none, later.get_token()), clock.now());
  EXPECT_EQ(delivery.failures(), 0);
}

}  // namespace
}  // namespace Tallyhouse
