// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLComponents.h>

namespace Varnel::Platform::Testing {

/// A client whose server is a function of the test. Any thread, if the function allows it.
///
///     FakeHTTPClient http;
///     http.setServer([](const HTTPPost&) { return HTTPResponse{.status = 503}; });
class FakeHTTPClient final : public HTTPClient {
 public:
  using Answer = Result<HTTPResponse, HTTPFailure>;
  using Server = std::function<Answer(const HTTPPost&)>;

  /// Posts that go wrong never reach the server.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  /// At first every post is answered with 200.
  void setServer(Server server) {
    const std::lock_guard lock(mutex_);
    server_ = std::move(server);
  }

  [[nodiscard]] Answer post(const HTTPPost& request, std::stop_token stop) override {
    const Fault fault = faults->nextInTime(stop);
    if (stop.stop_requested()) return HTTPFailure{"cancelled"};
    if (!canBePosted(request)) return HTTPFailure{"no such place"};
    if (fault != Fault::none)
      return HTTPFailure{fault == Fault::absent ? "no server" : "no answer"};
    Server server;
    {
      const std::lock_guard lock(mutex_);
      posts_.push_back(request);
      server = server_;
    }
    return server(request);
  }

  /// Everything posted so far.
  [[nodiscard]] std::vector<HTTPPost> posts() const {
    const std::lock_guard lock(mutex_);
    return posts_;
  }

 private:
  static bool canBePosted(const HTTPPost& request) {
    const auto url = URL::parse(request.url);
    return url && !isCutShort(request.url) && !url->components().host.value_or("").empty() &&
           (url->hasScheme("https") || (request.allowsPlainHTTP && url->hasScheme("http")));
  }

  mutable std::mutex mutex_;  ///< Owns both.
  Server server_ = [](const HTTPPost&) { return HTTPResponse{.status = 200, .retryAfter = {}}; };
  std::vector<HTTPPost> posts_;
};

}  // namespace Varnel::Platform::Testing
