// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>

namespace Tallyhouse {

/// What the server's answer means for the events of a batch.
enum class Verdict {
  delivered,  ///< They arrived.
  refused,    ///< The server will not have them as they are.
  later,      ///< Nothing is known of them: send them again.
};

/// The events that wait for delivery.
struct Backlog final {
  std::int64_t waiting = 0;
  std::optional<Varnel::Platform::Date> oldest;  ///< Of the waiting events; absent if none.
  bool hasRefused = false;  ///< Whether some were refused, but not often enough to be set aside.
};

/// Decides when events are sent, how many at once, and what becomes of those that fail. Plain
/// figures and functions of them: no clock, no network, no state.
struct VARNEL_API DeliveryPolicy final {
  using Duration = std::chrono::milliseconds;

  Duration linger = std::chrono::seconds(5);  ///< For how long an event waits for company.
  Duration firstRetry = std::chrono::seconds(5);
  Duration maxRetryDelay = std::chrono::hours(1);
  Duration maxRetryAfter = std::chrono::hours(24);  ///< The longest pause that is granted.
  int maxRefusals = 3;  ///< After this many refusals an event is set aside.
  std::size_t maxBatchEvents = 20;
  std::size_t maxBatchBytes = 15'000;

  /// What an HTTP status means; no status means that there was no answer.
  [[nodiscard]] static Verdict verdict(std::optional<int> status);

  /// How long to leave the server alone after the last of `failures` (1 or more) in a row: twice as
  /// long each time, shortened by up to half at random (0 to 1) so that clients do not come back
  /// together, and never less than the server asked for.
  [[nodiscard]] Duration retryDelay(int failures, std::optional<std::chrono::seconds> retryAfter,
                                    double random) const;

  /// When to send next: `now` or before means at once, absent that there is nothing to send.
  /// `notBefore` is the end of the last retry delay. A clock that was set back delays nothing for
  /// longer than the longest delay.
  [[nodiscard]] std::optional<Varnel::Platform::Date> nextSending(
      const Backlog& backlog, std::optional<Varnel::Platform::Date> notBefore,
      Varnel::Platform::Date now) const;
};

}  // namespace Tallyhouse
