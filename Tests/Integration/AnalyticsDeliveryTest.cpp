// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <dlfcn.h>
#include <netdb.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <future>
#include <map>
#include <memory>
#include <optional>
#include <semaphore>
#include <set>
#include <string_view>
#include <thread>

#include <Tests/Support/AnalyticsServer.h>
#include <Tests/Support/ChildProcess.h>
#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

namespace {

// A name server that is silent for as long as a test wants.
constexpr std::string_view silentHost = "silent.example";
std::binary_semaphore isAskedForSilentHost(0);
std::binary_semaphore mayAnswer(0);

}  // namespace

// Stands before the system's: the module's library finds names here.
extern "C" __attribute__((visibility("default"))) int getaddrinfo(const char* node,
                                                                  const char* service,
                                                                  const addrinfo* hints,
                                                                  addrinfo** found) {
  if (node && node == silentHost) {
    isAskedForSilentHost.release();
    mayAnswer.acquire();
    return EAI_FAIL;
  }
  static const auto real =
      reinterpret_cast<decltype(&getaddrinfo)>(::dlsym(RTLD_NEXT, "getaddrinfo"));
  return real(node, service, hints, found);
}

namespace Tallyhouse {
namespace {

using namespace std::chrono_literals;
using Varnel::Platform::HTTPPost;
using Varnel::Platform::URL;

// The proxies that the environment names while this object lives.
class Proxies final {
 public:
  explicit Proxies(const std::string& address) {
    for (const char* name : names) ::setenv(name, address.c_str(), 1);
    for (const char* name : {"no_proxy", "NO_PROXY"}) ::unsetenv(name);
  }
  ~Proxies() {
    for (const char* name : names) ::unsetenv(name);
  }
  Proxies(const Proxies&) = delete;
  Proxies& operator=(const Proxies&) = delete;

 private:
  static constexpr const char* names[] = {"http_proxy", "https_proxy", "all_proxy"};
};

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

// How often each event is seen until so many different ones are.
std::map<std::string, int> seenBy(Server& server, std::size_t different) {
  std::map<std::string, int> seen;
  while (seen.size() < different)
    for (const std::string& hit : server.next().hits()) ++seen[parameter(hit, "z")];
  return seen;
}

TEST_F(AnalyticsDeliveryTest, OfFourProcessesOneSendsEachEventOnce) {
  Server server({"200"});
  std::vector<std::unique_ptr<Process>> processes;
  for (int i = 0; i < 4; ++i) processes.push_back(recording(server, spoolPath()));
  for (const auto& [uuid, times] : seenBy(server, 4000)) EXPECT_EQ(times, 1) << uuid;
  for (const auto& process : processes) {
    EXPECT_EQ(lastWord(*process), "tracked");
    EXPECT_EQ(process->readLine(), "delivered");
  }
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

TEST_F(AnalyticsDeliveryTest, AKilledProcessDeliversOnTheNextStart) {
  constexpr std::size_t count = 250;
  std::set<std::string> before;
  {
    Server server({"200", "hang"});
    Varnel::Tests::ChildProcess process(
        {VARNEL_ANALYTICS_PROCESS, server.url(), spoolPath(), std::to_string(count)});
    EXPECT_EQ(lastWord(process), "tracked");
    // Killed in the midst of it: some have arrived, some hang, some have never been sent.
    for (const std::string& hit : server.next().hits()) before.insert(parameter(hit, "z"));
    server.next();
    process.kill();
  }
  Server server({"200"});
  const auto transport = this->transport(server.url());
  AnalyticsTracker tracker(transport, Consent::granted);
  EXPECT_TRUE(transport->drain(60s));
  std::set<std::string> actions;
  std::set<std::string> uuids = before;
  while (uuids.size() < count) {
    const auto request = server.next();
    ASSERT_FALSE(request.hits().empty());
    for (const std::string& hit : request.hits()) {
      uuids.insert(parameter(hit, "z"));
      actions.insert(parameter(hit, "ea"));
    }
  }
  EXPECT_EQ(uuids.size(), count);
  EXPECT_EQ(actions.size(), count - before.size());
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

Varnel::Platform::HTTPClient& http() {
  return Varnel::Platform::processPorts().httpClient;
}

HTTPPost postTo(const std::string& url) {
  return {.url = url, .contentType = "text/plain", .body = "x", .allowsPlainHTTP = true};
}

// The status that comes from there; 0 without one.
int statusOf(const std::string& url) {
  const auto answer = http().post(postTo(url), {});
  return answer ? answer->status : 0;
}

std::string portOf(const Server& server) {
  return std::string(URL::parse(server.url())->components().port.value_or(""));
}

// Makes this process trust the certificate of the tests, which is for 127.0.0.1 and
// collect.example, and no other. Returns why not, if so.
std::string trustCertificate() {
  constexpr const char* trusted = "/etc/ssl/certs/ca-certificates.crt";
  if (const std::string reason = Varnel::Tests::enterMountNamespace(); !reason.empty())
    return reason;
  if (::mount(VARNEL_CERTIFICATE, trusted, nullptr, MS_BIND, nullptr) != 0)
    return std::string("no other ") + trusted;
  return {};
}

TEST(HTTPClient, LetsAForkedChildEndWhileAPostHangs) {
  Server server({"hang"});
  std::stop_source stop;
  std::thread stopper([&] {
    server.next();
    const pid_t child = ::fork();
    if (child == 0) {
      ::alarm(10);
      std::exit(0);
    }
    int status = 0;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status));
    stop.request_stop();
  });
  EXPECT_FALSE(http().post(postTo(server.url()), stop.get_token()));
  stopper.join();
}

TEST(HTTPClient, TakesAFinalStatusForTheAnswerWhateverFollows) {
  Server server({"endless", "short", "stuck", "201"});
  for (const int status : {200, 200, 200, 201}) {
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(statusOf(server.url()), status);
    EXPECT_LT(std::chrono::steady_clock::now() - start, 10s) << server.next().behaviour;
  }
}

TEST(HTTPClient, RefusesACertificateThatNobodySignedOrThatIsForAnotherHost) {
  Server server({"secure", "200"});
  const auto refusal = [&](const std::string& host) {
    const auto answer = http().post(postTo("https://" + host + ":" + portOf(server)), {});
    return answer ? std::to_string(answer->status) : answer.error().message;
  };
  EXPECT_NE(refusal("127.0.0.1").find("certificate"), std::string::npos) << refusal("127.0.0.1");
  if (const std::string reason = trustCertificate(); !reason.empty()) GTEST_SKIP() << reason;
  EXPECT_EQ(refusal("127.0.0.1"), "200");
  EXPECT_NE(refusal("localhost").find("certificate"), std::string::npos) << refusal("localhost");
}

TEST(HTTPClient, GoesThroughAProxyButNotToThisMachine) {
  if (const std::string reason = trustCertificate(); !reason.empty()) GTEST_SKIP() << reason;
  Server server({"200"});
  Server proxy({"tunnel", "201", "tunnel", "403", "blind tunnel", "202"});
  const Proxies proxies("http://127.0.0.1:" + portOf(proxy));

  for (const char* host : {"127.0.0.1", "LOCALHOST", "a.localhost", "127.1", "0x7F000001"})
    EXPECT_EQ(statusOf("http://" + std::string(host) + ":" + portOf(server)), 200) << host;
  for (const char* url : {"http://localhost.:1", "http://[::1]:1", "https://[0:0::1]:1",
                          "http://[::ffff:127.0.0.1]:1", "HTTPS://127.0.0.2:1"})
    EXPECT_EQ(statusOf(url), 0) << url;

  // A tunnel's inside is the server's alone, and the proxy's words are not the server's.
  EXPECT_EQ(statusOf("https://collect.example"), 201);
  EXPECT_EQ(statusOf("https://other.example"), 0) << "a certificate for another host";
  EXPECT_EQ(statusOf("https://collect.example:444"), 0) << "refused";
  EXPECT_EQ(statusOf("https://collect.example:445"), 0) << "led nowhere";
  for (const char* url : {"http://127.0.0.1.example", "http://notlocalhost"})
    EXPECT_EQ(statusOf(url), 202) << url;
  for (const char* behaviour : {"tunnel", "201", "tunnel", "403", "blind tunnel", "202", "202"})
    EXPECT_EQ(proxy.next().behaviour, behaviour);
}

TEST(HTTPClient, StopsWhileANameServerIsSilent) {
  std::stop_source stop;
  auto answer = std::async(std::launch::async, [&] {
    return http().post(postTo("https://" + std::string(silentHost)), stop.get_token()).hasValue();
  });
  isAskedForSilentHost.acquire();
  stop.request_stop();
  EXPECT_EQ(answer.wait_for(10s), std::future_status::ready);
  mayAnswer.release();
  EXPECT_FALSE(answer.get());
}

}  // namespace
}  // namespace Tallyhouse
