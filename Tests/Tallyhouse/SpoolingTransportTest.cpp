// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/SpoolingTransport.h>

#include <sys/wait.h>
#include <unistd.h>

#include <semaphore>

#include <Tests/Support/Crew.h>
#include <Tests/Tallyhouse/SpoolFixture.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>
#include <Varnel/Platform/Testing/FaultyPrivateFiles.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>

namespace Tallyhouse {
namespace {

using namespace std::chrono_literals;
using Varnel::Platform::HTTPFailure;
using Varnel::Platform::HTTPPost;
using Varnel::Platform::HTTPResponse;
using Varnel::Platform::URL;

class SpoolingTransportTest : public Tests::SpoolFixture {
 protected:
  std::unique_ptr<SpoolingTransport> make(
      SpoolingTransport::Ports ports, const char* endpoint = "https://h.example/batch",
      SpoolingTransport::PlainHTTP plain = SpoolingTransport::PlainHTTP::refused) {
    return SpoolingTransport::make(ports, {.endpoint = *URL::parse(endpoint),
                                           .trackingID = "QN-1",
                                           .clientID = "12.34",
                                           .spoolPath = path(),
                                           .plainHTTP = plain});
  }
  std::unique_ptr<SpoolingTransport> make() { return make({clock, http, *files, log}); }

  static void track(AnalyticsTracker& tracker, std::string_view action) {
    tracker.context()->trackEvent("Category", action, std::nullopt, std::nullopt, {}, {});
  }

  Varnel::Platform::Testing::FakeHTTPClient http;
};

TEST_F(SpoolingTransportTest, TakesHTTPSUnlessToldOtherwise) {
  using enum SpoolingTransport::PlainHTTP;
  const SpoolingTransport::Ports ports{clock, http, *files, log};
  EXPECT_TRUE(make(ports, "HTTPS://h.example"));
  EXPECT_TRUE(make(ports, "http://h.example/batch", allowed));
  for (const char* url :
       {"http://h.example/batch", "file:///etc/passwd", "//h/batch", "https:///x"})
    EXPECT_FALSE(make(ports, url)) << url;
  EXPECT_FALSE(make(ports, "ftp://h.example/batch", allowed));
}

TEST_F(SpoolingTransportTest, AWithdrawnConsentStopsTransfersAndForgets) {
  std::binary_semaphore isPosting(0);
  std::binary_semaphore mayAnswer(0);
  http.setServer([&](const HTTPPost&) -> Varnel::Platform::Testing::FakeHTTPClient::Answer {
    isPosting.release();
    mayAnswer.acquire();
    return HTTPFailure{"lost"};
  });
  const auto transport = std::shared_ptr(make());
  AnalyticsTracker tracker({clock}, transport, Consent::granted);
  for (int i = 0; i < 40; ++i) track(tracker, "Before");
  isPosting.acquire();
  tracker.context()->setConsent(Consent::refused);
  track(tracker, "Meanwhile");
  mayAnswer.release();
  EXPECT_FALSE(transport->drain(30s));

  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 200, .retryAfter = {}}; });
  tracker.context()->setConsent(Consent::granted);
  track(tracker, "After");
  EXPECT_TRUE(transport->drain(30s));
  const auto posts = http.posts();
  ASSERT_EQ(posts.size(), 2u);
  EXPECT_NE(posts[1].body.find("ea=After"), std::string::npos);
  EXPECT_EQ(posts[1].body.find('\n'), std::string::npos);
}

// The child has no thread to wait for, and frees no lock that is its parent's too.
TEST_F(SpoolingTransportTest, AForkedChildEndsAndLeavesAllToItsParent) {
  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 503, .retryAfter = {}}; });
  auto transport = std::shared_ptr(make());
  auto tracker = std::make_unique<AnalyticsTracker>(AnalyticsContext::Ports{clock}, transport,
                                                    Consent::granted);
  track(*tracker, "Before");
  EXPECT_FALSE(transport->drain(30s));
  const pid_t child = ::fork();
  if (child == 0) {
    ::alarm(10);
    track(*tracker, "Child");
    const bool isDrained = transport->drain(30s);
    transport->discardAll();
    const bool isDiscarded = transport->hasDiscardedAll();
    tracker.reset();
    transport.reset();
    ::_exit(isDrained || isDiscarded ? 1 : 0);
  }
  int status = -1;
  ::waitpid(child, &status, 0);
  EXPECT_EQ(status, 0);
  track(*tracker, "After");
  EXPECT_EQ(transport->counts().waiting, 2);
}

TEST_F(SpoolingTransportTest, WhatEarlierRunsLeftGoesWithConsentAlone) {
  append(*openRecorder(), {"a", "b"});
  { AnalyticsTracker tracker({clock}, make(), Consent::refused); }
  EXPECT_TRUE(http.posts().empty());
  EXPECT_EQ(names(), "");

  append(*openRecorder(), {"c"});
  { AnalyticsTracker tracker({clock}, make()); }
  EXPECT_TRUE(http.posts().empty());
  const auto transport = std::shared_ptr(make());
  AnalyticsTracker tracker({clock}, transport, Consent::granted);
  EXPECT_TRUE(transport->drain(30s));
  EXPECT_EQ(http.posts().size(), 1u);
}

TEST_F(SpoolingTransportTest, ARefusalGoesOnUntilALockedSpoolIsEmpty) {
  append(*openRecorder(), {"a"});
  Tests::OtherConnection lock(path(), "BEGIN IMMEDIATE");
  const auto transport = std::shared_ptr(make());
  AnalyticsTracker tracker({clock}, transport, Consent::refused);
  EXPECT_FALSE(transport->hasDiscardedAll());
  tracker.context()->setConsent(Consent::granted);
  EXPECT_TRUE(transport->drain(30s)) << "of its own there is nothing";
  EXPECT_TRUE(http.posts().empty()) << "what is to be forgotten is not sent";
  lock.end();
  const auto end = std::chrono::steady_clock::now() + 30s;
  while (!transport->hasDiscardedAll() && std::chrono::steady_clock::now() < end) clock.advance(1s);
  EXPECT_TRUE(transport->hasDiscardedAll());
  EXPECT_EQ(names(), "");
}

TEST_F(SpoolingTransportTest, ADrainAnswersForItsOwnProcessWhoeverDelivers) {
  std::binary_semaphore isPosting(0);
  std::binary_semaphore mayAnswer(0);
  http.setServer([&](const HTTPPost&) {
    isPosting.release();
    mayAnswer.acquire();
    return HTTPResponse{.status = 200, .retryAfter = {}};
  });
  const auto one = std::shared_ptr(make());
  const auto other = std::shared_ptr(make());
  AnalyticsTracker tracker({clock}, one, Consent::granted);
  AnalyticsTracker otherTracker({clock}, other, Consent::granted);
  track(otherTracker, "Theirs");
  Varnel::Tests::Crew(4, [&](unsigned) {
    for (int i = 0; i < 5; ++i) track(tracker, "Ours");
  });
  isPosting.acquire();
  // One of the two is at it. Neither can say that its events are delivered, and neither sends any.
  EXPECT_FALSE(one->drain(1ms));
  EXPECT_FALSE(other->drain(1ms));
  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 200, .retryAfter = {}}; });
  mayAnswer.release();
  EXPECT_TRUE(one->drain(30s));
  EXPECT_TRUE(other->drain(30s));
  std::ptrdiff_t lines = 0;
  for (const HTTPPost& post : http.posts())
    lines += 1 + std::count(post.body.begin(), post.body.end(), '\n');
  EXPECT_EQ(lines, 21);
}

TEST_F(SpoolingTransportTest, NoCallThatFailsLosesAnEvent) {
  using Varnel::Platform::Testing::Fault;
  for (const Fault fault : {Fault::fails, Fault::absent}) {
    const std::size_t struck = sweepFaults(fault, [&](const auto& faults) {
      std::filesystem::remove_all(std::filesystem::path(path()).parent_path());
      Varnel::Platform::Testing::FaultyPrivateFiles faulty(*files);
      Varnel::Platform::Testing::FakeHTTPClient server;
      faulty.faults = server.faults = faults;
      const auto run = [&](std::initializer_list<const char*> actions) {
        const auto transport = std::shared_ptr(make({clock, server, faulty, log}));
        AnalyticsTracker tracker({clock}, transport, Consent::granted);
        for (const char* action : actions) track(tracker, action);
        return transport->drain(actions.size() == 0 ? 30s : 20ms);
      };
      const bool isDelivered = run({"First", "Second"});
      const std::size_t posts = server.posts().size();
      faults->mend();
      clock.advance(24h);
      EXPECT_TRUE(run({}));
      EXPECT_TRUE(!isDelivered || server.posts().size() == posts)
          << "what was said to be delivered";
      std::string bodies;
      for (const HTTPPost& post : server.posts()) bodies += post.body;
      for (const char* event : {"ea=First", "ea=Second"})
        EXPECT_NE(bodies.find(event), std::string::npos) << event << ", call " << faults->calls();
    });
    EXPECT_GT(struck, 20u);
  }
}

TEST_F(SpoolingTransportTest, ADrainEndsWhenTheServerFails) {
  http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 503, .retryAfter = {}}; });
  const auto transport = std::shared_ptr(make());
  AnalyticsTracker tracker({clock}, transport, Consent::granted);
  track(tracker, "Go");
  EXPECT_FALSE(transport->drain(1h));
  EXPECT_FALSE(transport->drain(1h)) << "nor does it wait for the pause to end";
  track(tracker, std::string(10'000, 'x'));
  EXPECT_EQ(transport->counts().dropped, 1);
}

}  // namespace
}  // namespace Tallyhouse
