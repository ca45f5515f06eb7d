// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/Delivery.h>

#include <utility>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/HTTPClient.h>
#include <Varnel/Tallyhouse/MeasurementProtocol.h>

namespace Tallyhouse {

using Varnel::Platform::HTTPPost;

namespace {

std::string batchOf(const std::vector<SpooledEvent>& events, Date now) {
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

Delivery::Step Delivery::step(Haste haste, const std::stop_token& stop) {
  if (!saveOutcome()) return fileIsAway();
  for (bool hasSent = false;;) {
    const auto outlook = spool_.look(endpoint_.url, policy_.maxBatchEvents, policy_.maxRefusals);
    if (!outlook) return fileIsAway();
    const auto next = nextSending(*outlook, haste);
    const bool isDue = next && *next <= ports_.clock.now();
    Step step{.state = isDue  ? State::due
                       : next ? State::later
                              : State::idle,
              .next = next,
              .waiting = outlook->backlog.waiting};
    if (!isDue || stop.stop_requested()) election_.reset();
    if (!isDue || stop.stop_requested() || hasSent) {
      filePause_.succeeded();
      return step;
    }
    if (!election_) {
      auto elected = spool_.elect();
      if (!elected) return fileIsAway();
      election_ = std::move(*elected);
      // Looked at again: the deliverer before may just have sent this.
      if (election_) continue;
      step.state = State::elsewhere;
      step.next = ports_.clock.now() + policy_.electionPause;
      return step;
    }
    // Those in line first, so that refused ones do not hold them up.
    auto events = spool_.waiting(policy_.maxBatchEvents, policy_.maxBatchBytes);
    if (events.empty()) events = spool_.refused(policy_.maxRefusals);
    if (events.empty()) return fileIsAway();
    send(std::move(events), outlook->state, stop);
    if (!saveOutcome()) return fileIsAway();
    hasSent = true;
  }
}

std::optional<Date> Delivery::nextSending(const SpoolOutlook& outlook, Haste haste) const {
  DeliveryPolicy policy = policy_;
  if (haste == Haste::none) policy.linger = {};
  return policy.nextSending(outlook.backlog, outlook.state.notBefore, ports_.clock.now());
}

void Delivery::rest() {
  election_.reset();
  outcome_.reset();
}

void Delivery::finish() {
  constexpr int maxTries = 5;
  for (int tries = 0; tries < maxTries && !saveOutcome(); ++tries) {
  }
  rest();
}

bool Delivery::saveOutcome() {
  if (outcome_ && !spool_.save(*outcome_)) return false;
  outcome_.reset();
  return true;
}

// Whoever holds an outcome that is not noted yet remains the deliverer, so that nobody repeats it.
Delivery::Step Delivery::fileIsAway() {
  if (!outcome_) election_.reset();
  const Date now = ports_.clock.now();
  if (filePause_.isOver(now)) filePause_.failed(now);
  return {.state = State::fileAway, .next = filePause_.end(), .waiting = 0};
}

void Delivery::send(std::vector<SpooledEvent> events, const DeliveryState& before,
                    const std::stop_token& stop) {
  const auto answer = ports_.httpClient.post(HTTPPost{.url = endpoint_.url,
                                                      .contentType = "text/plain; charset=utf-8",
                                                      .body = batchOf(events, ports_.clock.now()),
                                                      .allowsPlainHTTP = endpoint_.allowsPlainHTTP},
                                             stop);
  // An interrupted post says nothing about the server.
  if (!answer && stop.stop_requested()) return;

  const auto status = answer ? std::optional(answer->status) : std::nullopt;
  outcome_ = {.events = std::move(events),
              .verdict = DeliveryPolicy::verdict(status),
              .date = ports_.clock.now(),
              .state = {.server = endpoint_.url, .notBefore = {}}};
  if (outcome_->verdict == Verdict::delivered) return;
  DeliveryState& state = outcome_->state;
  state.obstacle = !answer && answer.error().isOffline ? Obstacle::network : Obstacle::server;
  state.failures = state.obstacle == before.obstacle ? before.failures + 1 : 1;
  state.notBefore =
      outcome_->date + policy_.retryDelay(state.failures, state.obstacle,
                                          answer ? answer->retryAfter : std::nullopt, random_());
}

}  // namespace Tallyhouse
