// SPDX-License-Identifier: MIT
// The write-ahead log beside the spool of events. What is appended is found, whatever the log was.
#include <algorithm>

#include <Fuzz/ForgedLog.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Tallyhouse/EventRecorder.h>
#include <Varnel/Tallyhouse/EventSpool.h>

using namespace Tallyhouse;
namespace Platform = Varnel::Platform;

static const auto files = Platform::POSIX::makePrivateFiles();
static constexpr std::size_t many = 1 << 20;

static void fuzz(std::string_view input) {
  Platform::Testing::CapturedSystemLog log;
  Platform::Testing::SimulatedClock clock(Date(std::chrono::hours(490'000)));
  const auto append = [&](EventRecorder& recorder, std::string_view uuid) {
    const bool isTaken = recorder.append(uuid, clock.now(), "ea=" + std::string(uuid)) > 0;
    return isTaken && !recorder.settle(EventRecorder::Haste::none);
  };
  static const ForgedLog forged([&](const std::string& path, const auto& keep) {
    EventRecorder recorder({*files, clock, log}, path, {});
    recorder.begin();
    for (const char* uuid : {"first", "second", "third"}) require(append(recorder, uuid));
    keep();
  });
  forged.forge(input);
  {
    EventRecorder recorder({*files, clock, log}, forged.path(), {});
    recorder.begin();
    if (!append(recorder, "last")) return;
  }
  EventSpool spool({*files, log}, forged.path());
  const auto waiting = spool.waiting(many, many);
  const auto holds = [&](std::string_view uuid) {
    return std::ranges::any_of(waiting, [&](const auto& event) { return event.uuid == uuid; });
  };
  require(holds("last"));
  if (input.empty()) require(holds("first") && holds("third"));
}
