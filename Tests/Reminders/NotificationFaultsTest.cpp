// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <memory>
#include <optional>

#include <Tests/Reminders/CenterProcess.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Platform {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;
using Testing::Fault;

constexpr Date start = sys_days(2026y / March / 1) + 8h;

// A process on a machine whose store and desktop go wrong by one plan.
struct Machine {
  explicit Machine(const std::shared_ptr<Testing::FaultPlan>& faults) {
    process.files.faults = process.server.faults = faults;
    process.listen();
  }

  void advanceTo(Date date) {
    process.timer.advanceTo(date);
    process.settle();
  }

  const Tests::TemporaryFolder folder = Tests::TemporaryFolder::inMemory();
  Testing::Process process{folder.path() / "store.sqlite", start};
};

// What was promised comes once, sooner or later. What was refused comes once at most: a store that
// goes away between its commit and its answer cannot tell.
TEST(NotificationFaults, LoseNoReminderThatWasPromised) {
  for (const Fault fault : {Fault::fails, Fault::absent})
    for (const std::size_t count : {1u, 3u}) {
      const auto calls = Testing::sweepFaults(
          fault,
          [&](const auto& faults) {
            Machine machine(faults);
            const bool isPromised = !machine.process.center.scheduleNotification(
                {.identifier = "once", .title = "Once", .deliveryDate = start + 1h});
            machine.advanceTo(start + 1h);
            machine.advanceTo(start + 2h);
            faults->mend();
            machine.advanceTo(start + 2h + ScheduledNotificationCenter::maxPause);
            machine.advanceTo(start + days(1));
            const std::size_t shown = machine.process.server.history().size();
            EXPECT_TRUE(shown == 1 || (shown == 0 && !isPromised))
                << shown << machine.process.log.text();
            const auto delivered = machine.process.center.deliveredNotifications();
            ASSERT_TRUE(delivered);
            EXPECT_EQ(delivered->size(), shown);
            const auto scheduled = machine.process.center.scheduledNotifications();
            ASSERT_TRUE(scheduled);
            EXPECT_TRUE(scheduled->empty());
          },
          count);
      EXPECT_GE(calls, 20u);
    }
}

// What the user saw and the host heard before the kill.
struct Trace {
  std::size_t shown = 0;
  std::size_t told = 0;
};

// Delivers in a process of its own, which is killed before this call on its files. None when it
// made no such call.
std::optional<Trace> deliverKilled(const std::filesystem::path& file, std::size_t call) {
  int pipe[2];
  EXPECT_EQ(::pipe(pipe), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    Testing::Process process(file, start + 1h);
    const auto end = [&] {
      const Trace trace{process.server.history().size(), process.listener->events.size()};
      static_cast<void>(::write(pipe[1], &trace, sizeof trace) == sizeof trace);
      ::raise(SIGKILL);
    };
    process.files.faults->plan(Fault::fails, call);
    process.files.whenStruck = end;
    process.listen();
    process.settle();
    process.files.whenStruck = [] {};
    ::_exit(0);
  }
  ::close(pipe[1]);
  Trace trace;
  const bool isKilled = ::read(pipe[0], &trace, sizeof trace) == sizeof trace;
  ::close(pipe[0]);
  ::waitpid(child, nullptr, 0);
  return isKilled ? std::optional(trace) : std::nullopt;
}

// Wherever it is killed, a deliverer has told of a delivery once at most, and only a banner whose
// number was not noted comes again.
TEST(NotificationFaults, AKillLosesNoDueReminder) {
  std::size_t kills = 0, doubles = 0;
  while (true) {
    const Tests::TemporaryFolder folder = Tests::TemporaryFolder::inMemory();
    const auto file = folder.path() / "store.sqlite";
    Testing::Process(file, start).schedule({.title = "Once", .deliveryDate = start + 1h});
    const auto killed = deliverKilled(file, kills + 1);
    if (!killed) break;
    ++kills;
    Testing::Process next(file, start + 1h);
    next.listen();
    next.settle();
    EXPECT_LE(killed->told + next.listener->events.size(), 1u) << kills;
    const std::size_t shown = killed->shown + next.server.history().size();
    EXPECT_TRUE(shown == 1 || (shown == 2 && killed->shown == 1)) << kills;
    if (shown == 2) ++doubles;
  }
  EXPECT_GE(kills, 20u);
  EXPECT_LT(doubles, kills / 3);
  RecordProperty("kills", static_cast<int>(kills));
  RecordProperty("doubles", static_cast<int>(doubles));
}

}  // namespace
}  // namespace Varnel::Platform
