// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <optional>
#include <stop_token>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// The content of a post, and where it goes.
struct HTTPPost final {
  std::string url;  ///< Percent-encoded.
  std::string contentType;
  std::string body;
  bool allowsPlainHTTP = false;  ///< Otherwise anything but https fails; other schemes always do.
};

/// The server's answer, without its content.
struct HTTPResponse final {
  int status = 0;
  std::optional<std::chrono::seconds> retryAfter;  ///< From now, if the server asks for a pause.
};

/// Why there is no answer.
struct HTTPFailure final {
  std::string message;
  bool isOffline = false;  ///< There is no network, as far as this machine can tell.
};

/// Posts to web servers. Any thread; posts wait for each other.
class VARNEL_API HTTPClient {
 public:
  virtual ~HTTPClient() = default;
  HTTPClient& operator=(const HTTPClient&) = delete;

  /// Posts and waits for the answer: for some 30 seconds, or until `stop` is requested. The
  /// server's certificate must be good. Redirections are not followed. The final status, once it
  /// has come, is the answer, whatever becomes of the content. A post whose answer got lost may
  /// have arrived, even twice. One to this machine itself never goes through a proxy.
  [[nodiscard]] virtual Result<HTTPResponse, HTTPFailure> post(const HTTPPost& request,
                                                               std::stop_token stop) = 0;
};

}  // namespace Varnel::Platform
