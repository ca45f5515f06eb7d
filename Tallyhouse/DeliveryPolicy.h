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

/// Why a batch was not delivered.
enum class Obstacle {
  network,  ///< There is none.
  server,   ///< It failed, refused, or said nothing.
};

/// The events that wait for delivery.
struct Backlog final {
  std::int64_t waiting = 0;                      ///< Counted up to a full batch.
  std::optional<Varnel::Platform::Date> oldest;  ///< Of the waiting events; absent if none.
  /// When the event whose turn is next was refused last; absent if none is to be tried again.
  std::optional<Varnel::Platform::Date> refused;
};

/// Decides when events are sent, how many at once, and what becomes of those that fail. Plain
/// figures and functions of them: no clock, no network, no state.
///
/// Many installations meet the same failing server. Their pauses are long and as different as they
/// are long, so that they do not come back in the same minute.
struct VARNEL_API DeliveryPolicy final {
  using Duration = std::chrono::milliseconds;

  Duration linger = std::chrono::seconds(5);  ///< For how long an event waits for company.
  Duration firstRetryOffline = std::chrono::seconds(5);  ///< Installations are offline one by one.
  Duration firstRetry = std::chrono::minutes(30);        ///< A server fails all of them together.
  Duration maxRetryOffline = std::chrono::minutes(1);
  Duration maxRetryDelay = std::chrono::hours(2);
  Duration maxRetryAfter = std::chrono::hours(24);  ///< The longest pause that is granted.
  int maxRefusals = 3;  ///< After this many refusals an event is set aside.
  /// Between two refusals of an event: a server that is mended soon sets nothing aside.
  Duration refusalDistance = std::chrono::hours(1);
  Duration electionPause = std::chrono::seconds(5);  ///< Until a busy deliverer is looked at again.
  std::size_t maxBatchEvents = 20;
  std::size_t maxBatchBytes = 15'000;

  /// What an HTTP status means; no status means that there was no answer.
  [[nodiscard]] static Verdict verdict(std::optional<int> status);

  /// How long to leave the server alone after the last of `failures` (1 or more) in a row by this
  /// obstacle. The pause doubles each time, and is shortened by up to half at random (0 to 1). A
  /// server that asks for a pause gets that one, lengthened by up to itself at random, if it is the
  /// longer.
  [[nodiscard]] Duration retryDelay(int failures, Obstacle obstacle,
                                    std::optional<std::chrono::seconds> retryAfter,
                                    double random) const;

  /// When to send next: `now` or before means at once, absent that there is nothing to send.
  /// `notBefore` is the end of the last retry delay. A clock that was set back delays nothing for
  /// longer than the longest delay.
  [[nodiscard]] std::optional<Varnel::Platform::Date> nextSending(
      const Backlog& backlog, std::optional<Varnel::Platform::Date> notBefore,
      Varnel::Platform::Date now) const;
};

}  // namespace Tallyhouse
