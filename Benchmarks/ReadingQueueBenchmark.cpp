// SPDX-License-Identifier: MIT

// The queue above admission against plain sessions: how long a disk has more readers than it
// admits, how long an urgent reader waits behind others, and what a small file costs.

#include <sys/resource.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <functional>
#include <latch>
#include <memory>
#include <mutex>
#include <numeric>
#include <string>
#include <thread>
#include <vector>

#include <Benchmarks/Measurements.h>
#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeReadingPriority.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Benchmarks {
namespace {

using namespace std::chrono_literals;
using Platform::URL;
using QoS = Platform::QualityOfService;
using Clock = std::chrono::steady_clock;

const URL volume = URL::fileURLWithPath("/disk/");

/// A machine with one rotational disk, which admits two readers.
struct Machine {
  Machine() {
    const auto device = devices.plug(
        {{"SMART Capable", true},
         {"Device Characteristics",
          Platform::PropertyDictionary{{"Serial Number", "HDD"}, {"Medium Type", "Rotational"}}}});
    devices.plug({{"BSD Name", "sda"}}, device);
    disks.setMountURLs("sda", {volume});
  }

  Platform::Testing::FakeDeviceRegistry devices;
  Platform::Testing::FakeDiskArbitration disks;
  Platform::Testing::FakeVolumeCatalog volumes;
  Platform::Testing::FakeSecurityScope scope;
  Platform::Testing::FakeReadingPriority priority;
  Basalt::NotificationCenter center;
  DiskAccessManager manager{{devices, disks, volumes, scope, center}};
  DiskReadingQueue queue{manager, {.readingPriority = priority}};

  std::unique_ptr<DiskAccessingSession> begin(QoS qos) {
    return manager.beginAccessingURL(volume, "benchmark", qos, false, {}, volume);
  }
};

/// A task made of a function, which the benchmark waits for.
class Job final : public DiskReadingTask {
 public:
  explicit Job(std::function<DiskReadingNext(DiskReadingTurn&)> run) : run_(std::move(run)) {}
  DiskReadingNext run(DiskReadingTurn& turn) override { return run_(turn); }
  void didEnd(DiskReadingResult) override { ended_.count_down(); }
  void wait() const { ended_.wait(); }

 private:
  const std::function<DiskReadingNext(DiskReadingTurn&)> run_;
  std::latch ended_{1};
};

std::shared_ptr<Job> submit(Machine& machine, QoS qos,
                            std::function<DiskReadingNext(DiskReadingTurn&)> run) {
  auto job = std::make_shared<Job>(std::move(run));
  machine.queue.submit(job, {.url = volume, .volumeURL = volume}, {.qos = qos});
  return job;
}

/// How much of the time how many were inside.
class Occupancy final {
 public:
  void enter() { change(1); }
  void leave() { change(-1); }
  [[nodiscard]] double max() const { return static_cast<double>(max_); }
  /// The share of the time in which more than two were.
  [[nodiscard]] double above() const {
    const double all = std::accumulate(times_.begin(), times_.end(), 0.0);
    return std::accumulate(times_.begin() + 3, times_.end(), 0.0) / all;
  }

 private:
  void change(int step) {
    const std::lock_guard lock(mutex_);
    const auto now = Clock::now();
    if (since_ != Clock::time_point())
      times_[inside_] += std::chrono::duration<double>(now - since_).count();
    since_ = now;
    inside_ += static_cast<std::size_t>(step);
    max_ = std::max(max_, inside_);
  }

  std::mutex mutex_;
  Clock::time_point since_;
  std::size_t inside_ = 0;
  std::size_t max_ = 0;
  std::vector<double> times_ = std::vector<double>(16);
};

constexpr int readers = 8;
constexpr int readings = 100;

void compareCrowds() {
  Machine machine;
  Occupancy occupancy;
  Occupancy strict;
  const auto readFrom = [](Occupancy& disk) {
    disk.enter();
    std::this_thread::sleep_for(5ms);
    disk.leave();
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < readers; ++i)
    threads.emplace_back([&] {
      for (int reading = 0; reading < readings; ++reading) {
        const DiskAccessGuard session(machine.begin(QoS::utility));
        readFrom(occupancy);
      }
    });
  for (std::thread& thread : threads) thread.join();

  std::vector<std::shared_ptr<Job>> jobs;
  for (int i = 0; i < readers; ++i)
    jobs.push_back(
        submit(machine, QoS::utility, [&, left = readings](DiskReadingTurn& turn) mutable {
          while (left > 0 && !turn.isOver()) {
            readFrom(strict);
            --left;
          }
          return left > 0 ? DiskReadingNext::again() : DiskReadingNext::done();
        }));
  for (const auto& job : jobs) job->wait();
  report("8 readers at once by the queue, most inside / two places", strict.max(), 2, 1.0, "");
  report("time with more than two inside, queue / sessions", 100 * strict.above(),
         100 * occupancy.above(), std::nullopt, "%");
}

// A turn is over at 20 ms, and the reading that is under way then takes up to 5 ms more.
void compareUrgentReaders() {
  Machine machine;
  std::atomic<bool> isOver = false;
  std::vector<std::shared_ptr<Job>> jobs;
  for (int i = 0; i < readers; ++i)
    jobs.push_back(submit(machine, QoS::background, [&](DiskReadingTurn& turn) {
      while (!turn.isOver()) std::this_thread::sleep_for(5ms);
      return isOver ? DiskReadingNext::done() : DiskReadingNext::again();
    }));
  std::vector<Nanoseconds> sessions;
  std::vector<Nanoseconds> tasks;
  for (int i = 0; i < 150; ++i) {
    std::this_thread::sleep_for(std::chrono::microseconds(20000 + 377 * (i % 50)));
    sessions.push_back(timeOf([&] { machine.begin(QoS::userInteractive)->endAccessing(); }));
    std::this_thread::sleep_for(std::chrono::microseconds(20000 + 377 * (i % 50)));
    tasks.push_back(timeOf([&] {
      submit(machine, QoS::userInteractive, [](DiskReadingTurn&) {
        return DiskReadingNext::done();
      })->wait();
    }));
  }
  isOver = true;
  for (const auto& job : jobs) job->wait();
  // A turn, and the reading that is under way at its end.
  const Nanoseconds turn = 25e6;
  report("urgent session behind turns of reading, p50 / a turn", median(sessions), turn);
  report("urgent session behind turns of reading, p99 / a turn", percentile(sessions, 0.99), turn);
  report("urgent task behind turns of reading, p50 / a turn", median(tasks), turn);
  report("urgent task behind turns of reading, p99 / a turn", percentile(tasks, 0.99), turn);
}

long contextSwitches() {
  rusage usage{};
  ::getrusage(RUSAGE_SELF, &usage);
  return usage.ru_nvcsw;  // The others are those of a busy machine.
}

void measureSmallFiles() {
  constexpr int files = 300'000;
  const auto readOne = [] {
    const auto end = Clock::now() + 4us;
    while (Clock::now() < end) continue;
  };
  struct Cost {
    Nanoseconds time;
    double switches;
  };
  const auto costOf = [](auto&& work) {
    const long before = contextSwitches();
    const Nanoseconds time = timeOf(work) / files;
    return Cost{time, static_cast<double>(contextSwitches() - before)};
  };
  Machine machine;
  machine.manager.setIsBackgroundMode(true);  // one reader
  const Cost nothing = costOf([&] {
    for (int i = 0; i < files; ++i) readOne();
  });
  const Cost task = costOf([&] {
    submit(machine, QoS::utility, [&, left = files](DiskReadingTurn& turn) mutable {
      while (left > 0 && !turn.isOver()) {
        readOne();
        --left;
      }
      return left > 0 ? DiskReadingNext::again() : DiskReadingNext::done();
    })->wait();
  });
  const Cost sessions = costOf([&] {
    std::vector<std::thread> threads;
    for (int i = 0; i < 2; ++i)
      threads.emplace_back([&] {
        for (int file = 0; file < files / 2; ++file) {
          const DiskAccessGuard session(machine.begin(QoS::utility));
          readOne();
        }
      });
    for (std::thread& thread : threads) thread.join();
  });
  const Cost list = costOf([&] {
    std::latch left(files);
    machine.queue.read(
        std::vector<DiskReadingFile>(
            files,
            {.url = volume, .volumeURL = volume, .place = 1, .enableSecureScopedAccess = false}),
        {.propose = "benchmark"},
        [&](const DiskReadingFile&, DiskReadingTurn&) {
          readOne();
          return DiskReadingNext::done();
        },
        [&](const DiskReadingFile&, DiskReadingResult) { left.count_down(); });
    left.wait();
  });
  report("a file of 4 µs in a task of the queue / nothing between", task.time, nothing.time);
  report("a file of 4 µs in a list of the queue / nothing between", list.time, nothing.time);
  report("a file of 4 µs in a session of its own / nothing between", sessions.time, nothing.time);
  report("switches of a task of 300,000 files / one in 100", task.switches, files / 100, 1.0, "");
  report("switches of a list of 300,000 files / one in 100", list.switches, files / 100, 1.0, "");
}

}  // namespace
}  // namespace Varnel::Benchmarks

int main() {
  using namespace Varnel::Benchmarks;
  compareCrowds();
  compareUrgentReaders();
  measureSmallFiles();
}
