// SPDX-License-Identifier: MIT
#include <Tests/Contract/HTTPClientContract.h>

#include <chrono>
#include <thread>

#include <Varnel/Platform/Testing/FakeHTTPClient.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;

HTTPPost postTo(const std::string& url, const std::string& body = "x") {
  return {.url = url, .contentType = "text/plain", .body = body, .allowsPlainHTTP = true};
}

TEST_P(HTTPClientContract, PostsTheWholeBodyAndTellsTheServersAnswer) {
  const std::string url = world->serve({"cut", "204", "503/7", "302>/elsewhere", "201"});
  const struct {
    std::string body;
    int status;
    std::optional<std::chrono::seconds> pause;
  } rows[] = {{"unanswered", 0, {}},
              {"a\0\xFF\r\n"s, 204, {}},
              {"", 503, 7s},
              {std::string(50'000, 'x'), 302, {}},
              {"last", 201, {}}};
  for (const auto& row : rows) {
    const auto answer = world->port().post(postTo(url, row.body), {});
    EXPECT_EQ(world->nextBody(), row.body);
    EXPECT_EQ(answer ? answer->status : 0, row.status);
    EXPECT_EQ(answer ? answer->retryAfter : std::nullopt, row.pause);
    EXPECT_TRUE(answer || (!answer.error().isOffline && !answer.error().message.empty()));
  }
}

TEST_P(HTTPClientContract, SendsNothingWhereItMayNotOrWhenItIsStopped) {
  const std::string url = world->serve({"200"});
  HTTPPost secure = postTo(url);
  secure.allowsPlainHTTP = false;
  EXPECT_FALSE(world->port().post(secure, {}));
  for (const std::string& wrong : {""s, "no url"s, "https:///batch"s, "ftp" + url.substr(4),
                                   "file:///etc/hostname"s, url + '\0'})
    EXPECT_FALSE(world->port().post(postTo(wrong), {})) << wrong;
  std::stop_source stop;
  stop.request_stop();
  EXPECT_FALSE(world->port().post(postTo(url), stop.get_token()));
  EXPECT_TRUE(world->port().post(postTo(url, "only"), {}));
  EXPECT_EQ(world->nextBody(), "only");
}

TEST_P(HTTPClientContract, StopsAtOnceAndHoldsNobodyUp) {
  const std::string url = world->serve({"hang"});
  std::stop_source stop;
  std::jthread stopper([&] {
    world->waitForHanging();
    std::stop_source other;
    other.request_stop();
    EXPECT_FALSE(world->port().post(postTo(url), other.get_token()));
    stop.request_stop();
  });
  EXPECT_FALSE(world->port().post(postTo(url), stop.get_token()));
}

class FakeHTTPClientWorld final : public FakeColumn<HTTPClientWorld, Testing::FakeHTTPClient> {
 public:
  std::string serve(const std::vector<std::string>& answers) override {
    if (answers.front() == "hang") port_.faults->plan(Testing::Fault::delays, 1);
    port_.setServer([this, answers](const HTTPPost&) { return answer(answers[answered_++]); });
    return "http://127.0.0.1/batch";
  }
  std::string nextBody() override { return port_.posts()[taken_++].body; }
  void waitForHanging() override { port_.faults->waitForCalls(1); }

 private:
  static Testing::FakeHTTPClient::Answer answer(const std::string& text) {
    if (text == "cut") return HTTPFailure{"cut"};
    HTTPResponse response{.status = std::stoi(text), .retryAfter = {}};
    if (const std::size_t mark = text.find('/'); mark == 3)
      response.retryAfter = std::chrono::seconds(std::stoi(text.substr(mark + 1)));
    return response;
  }

  std::size_t answered_ = 0;
  std::size_t taken_ = 0;
};
INSTANTIATE_TEST_SUITE_P(Fake, HTTPClientContract, on<FakeHTTPClientWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
