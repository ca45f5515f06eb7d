// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/Delivery.h>

#include <utility>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Tallyhouse/EventSpool.h>
#include <Varnel/Tallyhouse/MeasurementProtocol.h>

namespace Tallyhouse {

using Varnel::Platform::Date;
using Varnel::Platform::HTTPPost;

namespace {

std::string batchOf(std::span<const SpooledEvent> events, Date now) {
  std::string batch;
  for (const SpooledEvent& event : events)
    appendToBatch(batch, event.hit,
                  std::chrono::duration_cast<std::chrono::milliseconds>(now - event.date),
                  event.uuid);
  return batch;
}

}  // namespace

Delivery::Delivery(Ports ports, EventSpool& spool, Endpoint endpoint, DeliveryPolicy policy,
                   std::function<double()> random)
    : ports_(ports),
      spool_(spool),
      endpoint_(std::move(endpoint)),
      policy_(policy),
      random_(std::move(random)) {}

std::optional<Date> Delivery::step(Haste haste, std::stop_token stop) {
  const auto nextSending = [&] {
    DeliveryPolicy policy = policy_;
    if (haste == Haste::none) policy.linger = {};
    return policy.nextSending(spool_.backlog(policy.maxRefusals), notBefore_, ports_.clock.now());
  };
  const auto next = nextSending();
  if (!next || *next > ports_.clock.now() || stop.stop_requested()) return next;
  // Fresh events first, so that refused ones do not hold them up.
  if (const auto waiting = spool_.waiting(policy_.maxBatchEvents, policy_.maxBatchBytes);
      !waiting.empty())
    send(waiting, false, stop);
  else if (const auto refused = spool_.refused(policy_.maxRefusals))
    send({&*refused, 1}, true, stop);
  else if (nextSending())
    backOff({});  // The events cannot be read.
  return nextSending();
}

void Delivery::send(std::span<const SpooledEvent> events, bool areRefused, std::stop_token stop) {
  const auto answer = ports_.httpClient.post(HTTPPost{.url = endpoint_.url,
                                                      .contentType = "text/plain; charset=utf-8",
                                                      .body = batchOf(events, ports_.clock.now()),
                                                      .allowsPlainHTTP = endpoint_.allowsPlainHTTP},
                                             stop);
  // An interrupted post says nothing about the server.
  if (!answer && stop.stop_requested()) return;

  const Verdict verdict =
      DeliveryPolicy::verdict(answer ? std::optional(answer->status) : std::nullopt);
  if (verdict == Verdict::delivered) {
    // Events that cannot be removed are sent again. A pause keeps a full disk from making that a
    // flood.
    if (!(areRefused ? spool_.removeRefused(events.front()) : spool_.removeWaiting(events)))
      return backOff({});
    failures_ = 0;
    notBefore_.reset();
    return;
  }
  if (verdict == Verdict::refused) {
    if (areRefused)
      spool_.countRefusal(events.front());
    else
      spool_.moveToRefused(events);
  }
  backOff(answer ? answer->retryAfter : std::nullopt);
}

void Delivery::backOff(std::optional<std::chrono::seconds> retryAfter) {
  ++failures_;
  notBefore_ = ports_.clock.now() + policy_.retryDelay(failures_, retryAfter, random_());
}

}  // namespace Tallyhouse
