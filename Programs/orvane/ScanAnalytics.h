// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Identification/Analytics/CommonAnalyticsSender.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

namespace Orvane {

class Console;

/// The events of a scan. They count folders and groups and never name a file.
class ScanAnalytics final {
 public:
  /// Whether events can be sent there: by https, or within this machine by http as well.
  [[nodiscard]] static bool isEndpoint(const std::string& text);

  /// Empties the product's spool. Returns whether it is empty: others may keep it for longer than
  /// that, and it may not be had at all.
  static bool discardEvents(std::chrono::milliseconds patience = std::chrono::seconds(2));

  /// How many events wait in the product's spool.
  static std::int64_t waitingEvents();

  /// Nothing is sent without an endpoint, nor without the user's consent, which is complained of.
  /// Where that was refused, what waits is thrown away.
  ScanAnalytics(const std::optional<std::string>& endpoint, bool printsEvents, Console& console);
  /// Gives events a moment to arrive. Those that do not wait for the next run.
  ~ScanAnalytics();
  ScanAnalytics(const ScanAnalytics&) = delete;
  ScanAnalytics& operator=(const ScanAnalytics&) = delete;

  void scanStarted(std::size_t folders);
  void scanCancelled();
  void scanFinished(std::size_t groups);

 private:
  std::shared_ptr<Tallyhouse::SpoolingTransport> transport_;
  std::unique_ptr<Varnel::CommonAnalyticsSender> sender_;  ///< Null when events go nowhere.
};

}  // namespace Orvane
