// SPDX-License-Identifier: MIT
// The spool of events. What was appended to a file, whatever it held, is found in it.
#include <algorithm>

#include <Fuzz/ForgedDatabase.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Tallyhouse/EventRecorder.h>
#include <Varnel/Tallyhouse/EventSpool.h>

using namespace Tallyhouse;
namespace Platform = Varnel::Platform;

static const auto files = Platform::POSIX::makePrivateFiles();
static constexpr std::size_t many = 1 << 20;

static void deliver(EventSpool& spool, Date now) {
  const DeliveryPolicy policy;
  const auto outlook = spool.look("https://example.org", policy.maxBatchEvents, policy.maxRefusals);
  if (!outlook) return;
  static_cast<void>(policy.nextSending(outlook->backlog, outlook->state.notBefore, now));
  require(policy.retryDelay(outlook->state.failures, outlook->state.obstacle, std::nullopt, 0.5) <=
          policy.maxRetryDelay);
  DeliveryOutcome outcome{.date = now, .state = outlook->state};
  outcome.events = spool.waiting(1, policy.maxBatchBytes);
  require(outcome.events.size() <= 1);
  static_cast<void>(spool.refused(policy.maxRefusals));
  static_cast<void>(spool.save(outcome));
}

static void fuzz(std::string_view input) {
  Platform::Testing::CapturedSystemLog log;
  Platform::Testing::SimulatedClock clock(Date(std::chrono::hours(490'000)));
  const auto record = [&](const std::string& path, std::string_view uuid) {
    EventRecorder recorder({*files, clock, log}, path, {});
    recorder.begin();
    const bool isTaken = recorder.append(uuid, clock.now(), "ea=" + std::string(uuid)) > 0;
    return isTaken && !recorder.settle(EventRecorder::Haste::none);
  };
  static const ForgedDatabase database("Analytics.db", [&](const std::string& path) {
    require(record(path, "first") && record(path, "second"));
    ForgedDatabase::run(path, "PRAGMA wal_checkpoint(TRUNCATE)");
  });
  database.forge(input);
  clock.advance(std::chrono::minutes(1));
  EventSpool spool({*files, log}, database.path());
  deliver(spool, clock.now());
  if (!record(database.path(), "third")) return;
  const auto waiting = spool.waiting(many, many);
  require(std::any_of(waiting.begin(), waiting.end(),
                      [](const SpooledEvent& event) { return event.uuid == "third"; }));
}
