// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include <Tests/Support/ChildProcess.h>

namespace Varnel::Tests {

/// A web server in a process of its own (Tests/Integration/AnalyticsServer.cpp), and what it was
/// sent. Each request meets the next behaviour, and all further ones the last.
class AnalyticsServer final {
 public:
  struct Request {
    std::string behaviour;
    std::string body;

    /// The lines of the body.
    [[nodiscard]] std::vector<std::string> hits() const {
      std::vector<std::string> lines;
      for (std::size_t begin = 0; begin < body.size();) {
        const std::size_t end = std::min(body.find('\n', begin), body.size());
        lines.push_back(body.substr(begin, end - begin));
        begin = end + 1;
      }
      return lines;
    }
  };

  explicit AnalyticsServer(std::vector<std::string> behaviours)
      : process_(words(std::move(behaviours))) {
    url_ = "http://127.0.0.1:" + process_.readLine() + "/batch";
  }

  [[nodiscard]] const std::string& url() const { return url_; }

  /// Waits for the next request.
  Request next() {
    const std::string line = process_.readLine();
    const std::size_t blank = line.find(' ');
    return {.behaviour = line.substr(blank + 1),
            .body = process_.read(std::stoul("0" + line.substr(0, blank)))};
  }

 private:
  static std::vector<std::string> words(std::vector<std::string> behaviours) {
    behaviours.insert(behaviours.begin(), {VARNEL_ANALYTICS_SERVER, VARNEL_CERTIFICATE});
    return behaviours;
  }

  ChildProcess process_;
  std::string url_;
};

}  // namespace Varnel::Tests
