// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/SpoolingTransport.h>

#include <algorithm>
#include <exception>
#include <random>
#include <utility>

#include <Varnel/Platform/Concurrency/ForkedChild.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Tallyhouse/Delivery.h>
#include <Varnel/Tallyhouse/DeliveryWorker.h>
#include <Varnel/Tallyhouse/EventRecorder.h>
#include <Varnel/Tallyhouse/EventSpool.h>
#include <Varnel/Tallyhouse/MeasurementProtocol.h>

namespace Tallyhouse {
namespace {

bool isAcceptable(const Varnel::Platform::URL& endpoint, SpoolingTransport::PlainHTTP plain) {
  if (endpoint.components().host.value_or("").empty()) return false;
  return endpoint.hasScheme("https") ||
         (endpoint.hasScheme("http") && plain == SpoolingTransport::PlainHTTP::allowed);
}

std::function<double()> randomNumbers() {
  return [engine = std::minstd_rand(std::random_device()())]() mutable {
    return std::uniform_real_distribution<double>()(engine);
  };
}

// While the thread cannot deliver, it still moves appended events into the file now and then.
constexpr std::int64_t appendsUntilCheckpoint = 1000;

}  // namespace

struct SpoolingTransport::Parts {
  Parts(Ports ports, Configuration configuration)
      : identity{std::move(configuration.trackingID), std::move(configuration.clientID)},
        maxBatchEvents(static_cast<std::int64_t>(configuration.policy.maxBatchEvents)),
        maxRefusals(configuration.policy.maxRefusals),
        recorder({ports.privateFiles, ports.clock, ports.systemLog}, configuration.spoolPath,
                 {.maxEvents = configuration.maxEvents, .maxBytes = configuration.maxBytes}),
        spool({ports.privateFiles, ports.systemLog}, configuration.spoolPath),
        worker(ports.clock, recorder, spool,
               Delivery({ports.clock, ports.httpClient}, spool,
                        {.url = configuration.endpoint.absoluteString(),
                         .allowsPlainHTTP = configuration.plainHTTP == PlainHTTP::allowed},
                        configuration.policy, randomNumbers())) {}

  // In a forked child: the thread is missing there, locks may be held for ever, and what is freed
  // of the locks on files is freed for the parent too.
  [[nodiscard]] bool areTheParents() const { return forksBefore != Varnel::Platform::forksSoFar(); }

  const int forksBefore = Varnel::Platform::forksSoFar();
  const AnalyticsIdentity identity;
  const std::int64_t maxBatchEvents;
  const int maxRefusals;
  EventRecorder recorder;
  EventSpool spool;
  DeliveryWorker worker;
};

std::unique_ptr<SpoolingTransport> SpoolingTransport::make(Ports ports,
                                                           Configuration configuration) {
  if (!isAcceptable(configuration.endpoint, configuration.plainHTTP)) return nullptr;
  return std::unique_ptr<SpoolingTransport>(
      new SpoolingTransport(std::make_unique<Parts>(ports, std::move(configuration))));
}

std::unique_ptr<SpoolingTransport> SpoolingTransport::make(Configuration configuration) {
  return make(Varnel::Platform::processPorts(), std::move(configuration));
}

std::unique_ptr<SpoolingTransport> SpoolingTransport::make(const Varnel::Platform::Ports& ports,
                                                           Configuration configuration) {
  return make({ports.clock, ports.httpClient, ports.privateFiles, ports.systemLog},
              std::move(configuration));
}

SpoolingTransport::SpoolingTransport(std::unique_ptr<Parts> parts) : parts_(std::move(parts)) {}

SpoolingTransport::~SpoolingTransport() {
  if (parts_->areTheParents()) static_cast<void>(parts_.release());
}

void SpoolingTransport::start() noexcept try {
  if (parts_->areTheParents()) return;
  parts_->recorder.begin();
  parts_->worker.resume();
} catch (const std::exception&) {
  // The system grants no thread. The events stay in the spool for a later start.
}

void SpoolingTransport::accept(const AnalyticsEvent& event) noexcept try {
  if (parts_->areTheParents()) return;
  const std::string hit = encodedHit(event, parts_->identity);
  if (hit.size() > maxHitBytes) {
    parts_->recorder.countDropped();
    return;
  }
  const std::int64_t waiting = parts_->recorder.append(event.uuid, event.date, hit);
  // In between the thread sleeps on, and will send these events with the others.
  if (waiting == 1 || waiting == parts_->maxBatchEvents || waiting % appendsUntilCheckpoint == 0)
    parts_->worker.wake();
} catch (const std::exception&) {
  // Out of memory. The event is lost and the application goes on.
}

void SpoolingTransport::discardAll() noexcept try {
  if (parts_->areTheParents()) return;
  parts_->worker.pause();
  parts_->recorder.discard();
  parts_->worker.wake();
} catch (const std::exception&) {
  // Nothing is sent while the worker is paused; the next start of the process tries again.
}

bool SpoolingTransport::drain(std::chrono::milliseconds timeout) {
  return !parts_->areTheParents() && parts_->worker.drain(timeout);
}

bool SpoolingTransport::hasDiscardedAll() const {
  return !parts_->areTheParents() && !parts_->recorder.mustEmpty();
}

SpoolCounts SpoolingTransport::counts() const {
  if (parts_->areTheParents()) return {};
  return parts_->recorder.counts(parts_->maxRefusals);
}

}  // namespace Tallyhouse
