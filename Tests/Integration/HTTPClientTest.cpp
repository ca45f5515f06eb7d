// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <dlfcn.h>
#include <netdb.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <future>
#include <semaphore>
#include <string_view>
#include <thread>

#include <Tests/Support/AnalyticsServer.h>
#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/Proxies.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Values/URL.h>

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

namespace Varnel::Tests {
namespace {

using namespace std::chrono_literals;
using Platform::HTTPPost;
using Platform::URL;
using Server = AnalyticsServer;

Platform::HTTPClient& http() {
  return Platform::processPorts().httpClient;
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
  if (const std::string reason = enterMountNamespace(); !reason.empty()) return reason;
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
}  // namespace Varnel::Tests
