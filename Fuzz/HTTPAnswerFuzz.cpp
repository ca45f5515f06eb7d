// SPDX-License-Identifier: MIT
// What a web server answers, and the pause that follows from it.
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <thread>

#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Generic/Curl/Module.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>

using namespace Varnel::Platform;

/// A server on this machine that answers one post, and closes.
class Server final {
 public:
  Server() : listener_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    auto* const generic = reinterpret_cast<sockaddr*>(&address);
    require(::bind(listener_, generic, size) == 0 && ::listen(listener_, 8) == 0 &&
            ::getsockname(listener_, generic, &size) == 0);
    url_ = "http://127.0.0.1:" + std::to_string(ntohs(address.sin_port)) + "/";
  }
  ~Server() { ::close(listener_); }
  Server(const Server&) = delete;
  Server& operator=(const Server&) = delete;

  [[nodiscard]] const std::string& url() const { return url_; }

  void answer(std::string_view bytes, std::string_view body) const {
    const int client = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
    if (client < 0) return;
    std::string request;
    std::array<char, 4096> buffer;
    while (!request.ends_with(body)) {
      const ssize_t count = ::recv(client, buffer.data(), buffer.size(), 0);
      if (count <= 0) break;
      request.append(buffer.data(), static_cast<std::size_t>(count));
    }
    while (!bytes.empty()) {
      const ssize_t count = ::send(client, bytes.data(), bytes.size(), MSG_NOSIGNAL);
      if (count <= 0) break;
      bytes.remove_prefix(static_cast<std::size_t>(count));
    }
    ::close(client);
  }

 private:
  const int listener_;
  std::string url_;
};

static void fuzz(std::string_view input) {
  static const Server server;
  const std::string body = "ea=fuzz\n";
  std::thread answering([&] { server.answer(input, body); });
  const auto response = varnelHTTPClient()->post(
      {.url = server.url(), .contentType = "text/plain", .body = body, .allowsPlainHTTP = true},
      {});
  answering.join();
  if (!response) return require(!response.error().message.empty());
  require(response->status >= 200 && response->status < 1000);
  require(!response->retryAfter || response->retryAfter->count() > 0);
  const Tallyhouse::DeliveryPolicy policy;
  const auto pause = policy.retryDelay(1, Tallyhouse::Obstacle::server, response->retryAfter, 1);
  require(pause.count() > 0 && pause <= 2 * policy.maxRetryAfter);
}
