// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/DeliveryPolicy.h>

#include <algorithm>

namespace Tallyhouse {

using Varnel::Platform::Date;

Verdict DeliveryPolicy::verdict(std::optional<int> status) {
  constexpr int proxyAuthentication = 407;
  constexpr int requestTimeout = 408;
  constexpr int tooEarly = 425;
  constexpr int tooManyRequests = 429;
  if (!status) return Verdict::later;
  if (*status >= 200 && *status < 300) return Verdict::delivered;
  if (*status == proxyAuthentication || *status == requestTimeout || *status == tooEarly ||
      *status == tooManyRequests)
    return Verdict::later;
  return *status >= 400 && *status < 500 ? Verdict::refused : Verdict::later;
}

DeliveryPolicy::Duration DeliveryPolicy::retryDelay(int failures, Obstacle obstacle,
                                                    std::optional<std::chrono::seconds> retryAfter,
                                                    double random) const {
  const double share = std::clamp(random, 0.0, 1.0);
  const auto part = [](Duration whole, double ratio) {
    return std::chrono::duration_cast<Duration>(whole * ratio);
  };
  const bool isOffline = obstacle == Obstacle::network;
  const Duration max = isOffline ? maxRetryOffline : maxRetryDelay;
  Duration delay = isOffline ? firstRetryOffline : firstRetry;
  for (int i = 1; i < failures && delay < max; ++i) delay *= 2;
  delay = std::min(delay, max);
  delay -= part(delay, share / 2);
  // Compared in the server's own unit, in which its figure cannot overflow.
  const auto maxGranted = std::chrono::duration_cast<std::chrono::seconds>(maxRetryAfter);
  const Duration granted = std::min(retryAfter.value_or(std::chrono::seconds(0)), maxGranted);
  return std::max(delay, granted + part(granted, share));
}

std::optional<Date> DeliveryPolicy::nextSending(const Backlog& backlog,
                                                std::optional<Date> notBefore, Date now) const {
  // What lies in the future happened before the clock was set back: it has waited enough.
  const auto after = [now](Date past, Duration wait) { return past > now ? now : past + wait; };
  std::optional<Date> next;
  if (backlog.waiting >= static_cast<std::int64_t>(maxBatchEvents))
    next = now;
  else if (backlog.oldest)
    next = after(*backlog.oldest, linger);
  if (backlog.refused) {
    const Date again = after(*backlog.refused, refusalDistance);
    next = next ? std::min(*next, again) : again;
  }
  if (!next || !notBefore) return next;
  const Duration maxPause = std::max(maxRetryDelay, 2 * maxRetryAfter);
  return *notBefore > now + maxPause ? next : std::max(*next, *notBefore);
}

}  // namespace Tallyhouse
