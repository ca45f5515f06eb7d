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

DeliveryPolicy::Duration DeliveryPolicy::retryDelay(int failures,
                                                    std::optional<std::chrono::seconds> retryAfter,
                                                    double random) const {
  Duration delay = firstRetry;
  for (int i = 1; i < failures && delay < maxRetryDelay; ++i) delay *= 2;
  delay = std::min(delay, maxRetryDelay);
  delay -= std::chrono::duration_cast<Duration>(delay * (std::clamp(random, 0.0, 1.0) / 2));
  // Compared in the server's own unit, in which its figure cannot overflow.
  const auto maxGranted = std::chrono::duration_cast<std::chrono::seconds>(maxRetryAfter);
  return std::max<Duration>(delay,
                            std::min(retryAfter.value_or(std::chrono::seconds(0)), maxGranted));
}

std::optional<Date> DeliveryPolicy::nextSending(const Backlog& backlog,
                                                std::optional<Date> notBefore, Date now) const {
  std::optional<Date> next;
  if (backlog.hasRefused || backlog.waiting >= static_cast<std::int64_t>(maxBatchEvents))
    next = now;
  else if (backlog.oldest)
    // An event with a future date was made before the clock was set back: it has lingered enough.
    next = *backlog.oldest > now ? now : *backlog.oldest + linger;
  if (!next || !notBefore) return next;
  const Duration maxPause = std::max(maxRetryDelay, maxRetryAfter);
  return *notBefore > now + maxPause ? next : std::max(*next, *notBefore);
}

}  // namespace Tallyhouse
