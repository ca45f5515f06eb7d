// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <cctype>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string_view>

#include <Tests/Support/AnalyticsServer.h>
#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/Proxies.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

namespace Tallyhouse {
namespace {

using namespace std::chrono_literals;
using Varnel::Platform::URL;
using Varnel::Tests::Proxies;

using Server = Varnel::Tests::AnalyticsServer;

std::string parameter(const std::string& hit, std::string_view name) {
  for (const auto& item : Varnel::Platform::decodedURLQuery(hit))
    if (item.name == name) return item.value.value_or("");
  return "(none)";
}

class AnalyticsDeliveryTest : public testing::Test {
 protected:
  std::string spoolPath() const { return (folder_.path() / "Analytics.db").string(); }

  std::shared_ptr<SpoolingTransport> transport(const std::string& url) const {
    DeliveryPolicy quick;
    quick.linger = 1ms;
    quick.firstRetry = 1ms;
    quick.maxRetryDelay = 20ms;
    quick.maxRetryAfter = 1s;
    return SpoolingTransport::make({.endpoint = *URL::parse(url),
                                    .trackingID = "QN-1",
                                    .clientID = "12.34",
                                    .spoolPath = spoolPath(),
                                    .plainHTTP = SpoolingTransport::PlainHTTP::allowed,
                                    .policy = quick});
  }

  Varnel::Tests::TemporaryFolder folder_;
};

TEST_F(AnalyticsDeliveryTest, AnEventArrivesWithAllThatItCarries) {
  Server server({"204"});
  AnalyticsTracker tracker(transport(server.url()), Consent::granted);
  tracker.context()->trackEvent("Scan", "Finished", "100 % \xC3\xA4&=", -5,
                                {"12.34", std::nullopt, "13.0", "3", "2", "1", "0000001", "null"},
                                {std::nullopt, 7});
  const auto request = server.next();
  ASSERT_EQ(request.hits().size(), 1u);
  std::string carried;
  for (const char* name : {"tid", "cid", "ec", "ea", "el", "ev", "cd1", "cd2", "cd8", "cm1", "cm2"})
    carried += parameter(request.hits()[0], name) + '|';
  EXPECT_EQ(carried, "QN-1|12.34|Scan|Finished|100 % \xC3\xA4&=|-5|12.34|(none)|null|(none)|7|");
  EXPECT_EQ(parameter(request.hits()[0], "z").size(), 36u);
}

TEST_F(AnalyticsDeliveryTest, NoBehaviourOfAServerLosesOrRenamesAnEvent) {
  Server server({"503/1", "cut", "garbage", "500/99999999999999999999", "429/soon", "302", "200"});
  AnalyticsTracker tracker(transport(server.url()), Consent::granted);
  const auto start = std::chrono::steady_clock::now();
  tracker.context()->trackEvent("Scan", "Once", std::nullopt, std::nullopt, {}, {});
  std::set<std::string> uuids;
  std::string last;
  for (int i = 0; last != "200"; ++i) {
    const auto request = server.next();
    ASSERT_EQ(request.hits().size(), 1u) << request.behaviour;
    uuids.insert(parameter(request.hits()[0], "z"));
    last = request.behaviour;
    if (i == 1) {
      EXPECT_GE(std::chrono::steady_clock::now() - start, 1s) << "the pause asked for";
    }
  }
  EXPECT_EQ(uuids.size(), 1u);
}

TEST_F(AnalyticsDeliveryTest, AServerThatHangsDelaysNeitherTheCallerNorTheEnd) {
  Server server({"hang"});
  const auto start = std::chrono::steady_clock::now();
  {
    AnalyticsTracker tracker(transport(server.url()), Consent::granted);
    tracker.context()->trackEvent("Scan", "First", std::nullopt, std::nullopt, {}, {});
    EXPECT_EQ(server.next().hits().size(), 1u);
    for (int i = 0; i < 100; ++i)
      tracker.context()->trackEvent("Scan", "Next", std::nullopt, std::nullopt, {}, {});
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, 10s);
  Server other({"200"});
  const auto repeated = transport(other.url());
  AnalyticsTracker tracker(repeated, Consent::granted);
  EXPECT_TRUE(repeated->drain(30s));
  std::size_t arrived = 0;
  while (arrived < 101) arrived += other.next().hits().size();
  EXPECT_EQ(arrived, 101u);
}

using Process = Varnel::Tests::ChildProcess;

// What a process says when it has named all its events.
std::string lastWord(Process& process) {
  std::string line = process.readLine();
  while (!line.empty() && !std::isalpha(line[0])) line = process.readLine();
  return line;
}

std::unique_ptr<Process> recording(const Server& server, const std::string& spool) {
  return std::make_unique<Process>(
      std::vector<std::string>{VARNEL_ANALYTICS_PROCESS, server.url(), spool, "1000", "drain"});
}

TEST_F(AnalyticsDeliveryTest, WhenTheDelivererDiesAnotherTakesOver) {
  Server server({"200", "200", "hang", "200"});
  auto deliverer = recording(server, spoolPath());
  std::map<std::string, int> seen;
  std::set<std::string> underway;
  for (int i = 0; i < 3; ++i) {
    underway.clear();
    for (const std::string& hit : server.next().hits()) underway.insert(parameter(hit, "z"));
    for (const std::string& uuid : underway) ++seen[uuid];
  }
  EXPECT_EQ(lastWord(*deliverer), "tracked");
  std::vector<std::unique_ptr<Process>> others;
  for (int i = 0; i < 3; ++i) others.push_back(recording(server, spoolPath()));
  for (const auto& process : others) EXPECT_EQ(lastWord(*process), "tracked");
  deliverer->kill();
  while (seen.size() < 4000)
    for (const std::string& hit : server.next().hits()) ++seen[parameter(hit, "z")];
  // The server had taken the last batch, but nobody could note that.
  for (const auto& [uuid, times] : seen) EXPECT_EQ(times, underway.contains(uuid) ? 2 : 1) << uuid;
  for (const auto& process : others) EXPECT_EQ(process->readLine(), "delivered");
}

// The exit status of the host.
int orvane(std::vector<std::string> arguments) {
  arguments.insert(arguments.begin(), ORVANE_PROGRAM);
  return Varnel::Tests::ChildProcess(arguments).wait();
}

TEST_F(AnalyticsDeliveryTest, ARefusalTakesBackWhatHasNotBeenSent) {
  ::setenv("HOME", (folder_.path() / "home").c_str(), 1);
  const std::filesystem::path settings =
      folder_.path() / "home/.config/com.quennel.Orvane2/settings.ini";
  const auto keepAnswer = [&](const char* isGranted) {
    std::ofstream(settings) << "[Defaults]\nanalyticsConsent=" << isGranted << '\n';
  };
  const std::string scanned = folder_.write("scanned/file", "content").parent_path();
  Server server({"204"});
  const std::vector<std::string> away = {"scan", "--analytics", "http://127.0.0.1:1", scanned,
                                         scanned};
  EXPECT_EQ(orvane({"scan", "--analytics", server.url(), scanned, scanned}), 0) << "not asked";
  ASSERT_EQ(orvane({"analytics", "consent", "yes"}), 0);
  EXPECT_EQ(orvane(away), 0);
  EXPECT_EQ(Varnel::Tests::outputOf(ORVANE_PROGRAM " analytics"), "consent: yes\nwaiting: 2\n");
  ASSERT_EQ(orvane({"analytics", "consent", "no"}), 0);
  EXPECT_EQ(orvane({"scan", "--analytics", server.url(), scanned, scanned}), 0) << "refused";
  ASSERT_EQ(orvane({"analytics", "consent", "yes"}), 0);
  // A command that was killed when it had kept the answer leaves the rest to the next.
  EXPECT_EQ(orvane(away), 0);
  keepAnswer("false");
  ASSERT_EQ(orvane({"analytics", "consent", "yes"}), 0);
  EXPECT_EQ(orvane(away), 0);
  keepAnswer("false");
  EXPECT_EQ(orvane(away), 0);
  keepAnswer("true");
  EXPECT_EQ(orvane({"scan", "--analytics", server.url(), scanned}), 0);
  EXPECT_EQ(parameter(server.next().hits().at(0), "ev"), "1") << "the folders of the last scan";
}

TEST_F(AnalyticsDeliveryTest, AScanSendsItsEventsOnceWhateverItsEnvironment) {
  ::setenv("HOME", (folder_.path() / "home").c_str(), 1);
  const Proxies proxies("http://127.0.0.1:1");
  folder_.write("scanned/file", "content");
  ASSERT_EQ(orvane({"analytics", "consent", "yes"}), 0);
  Server server({"short"});
  for (int run = 0; run < 2; ++run) {
    Varnel::Tests::ChildProcess orvane({ORVANE_PROGRAM, "scan", "--analytics",
                                        "HTTP" + server.url().substr(4),
                                        (folder_.path() / "scanned").string()});
    EXPECT_EQ(orvane.readLine(), "1 file in 1 folder: no duplicates");
    std::vector<std::string> events;
    while (events.size() < 2)
      for (const std::string& hit : server.next().hits())
        events.push_back(parameter(hit, "ec") + " " + parameter(hit, "ea"));
    EXPECT_EQ(events, (std::vector<std::string>{"Scan Started", "Scan Finished"}));
    EXPECT_EQ(orvane.wait(), 0);
  }
  for (const char* refused : {"http://collect.example/", "HTTPS:///batch", "ftp://127.0.0.1/"})
    EXPECT_EQ(
        Varnel::Tests::ChildProcess({ORVANE_PROGRAM, "scan", "--analytics", refused, "/"}).wait(),
        2)
        << refused;
}

}  // namespace
}  // namespace Tallyhouse
