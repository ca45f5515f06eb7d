// SPDX-License-Identifier: MIT

// The admission to disks against what a program would otherwise do by hand. Each stand-in is
// measured in turns with ours; only the ratios of one run mean anything.

#include <semaphore.h>

#include <array>
#include <atomic>
#include <cstdlib>
#include <deque>
#include <latch>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

#include <Benchmarks/AllocationCounter.h>
#include <Benchmarks/Measurements.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Benchmarks {
namespace {

using Platform::URL;
using QoS = Platform::QualityOfService;

/// A semaphore for the stand-ins.
class PlainSemaphore final {
 public:
  PlainSemaphore() { ::sem_init(&semaphore_, 0, 0); }
  ~PlainSemaphore() { ::sem_destroy(&semaphore_); }
  void post() { ::sem_post(&semaphore_); }
  void wait() {
    while (::sem_wait(&semaphore_) != 0) {
    }
  }

 private:
  sem_t semaphore_;
};

/// One place, taken in turns and handed straight to the one who has waited longest.
class FirstInFirstOut final {
 public:
  void begin(QoS) {
    PlainSemaphore turn;
    {
      const std::lock_guard lock(mutex_);
      if (!isTaken_) {
        isTaken_ = true;
        return;
      }
      waiting_.push_back(&turn);
    }
    turn.wait();
  }
  void end() {
    PlainSemaphore* next = nullptr;
    {
      const std::lock_guard lock(mutex_);
      if (waiting_.empty()) {
        isTaken_ = false;
        return;
      }
      next = waiting_.front();
      waiting_.pop_front();
    }
    next->post();
  }

 private:
  std::mutex mutex_;
  bool isTaken_ = false;
  std::deque<PlainSemaphore*> waiting_;
};

/// The admission of the manager, as one would write it with a mutex and a semaphore a request.
class PlainAdmission final {
 public:
  void begin(QoS qos) {
    const auto request = std::make_shared<Request>();
    {
      const std::lock_guard lock(mutex_);
      if (holders_.empty() || isHolder(std::this_thread::get_id())) {
        holders_.push_back(std::this_thread::get_id());
        return;
      }
      waiting_[classOf(qos)].push_back(request);
    }
    request->semaphore.wait();
    const std::lock_guard lock(mutex_);
    holders_.push_back(std::this_thread::get_id());
  }
  void end() {
    std::vector<std::shared_ptr<Request>> granted;
    {
      const std::lock_guard lock(mutex_);
      holders_.erase(std::find(holders_.begin(), holders_.end(), std::this_thread::get_id()));
      if (!holders_.empty()) return;
      for (auto& requests : waiting_) {
        for (auto& request : requests)
          if (!request->isClaimed.test_and_set()) granted.push_back(std::move(request));
        requests.clear();
      }
    }
    for (const auto& request : granted) request->semaphore.post();
  }
  [[nodiscard]] bool hasWaiter() {
    const std::lock_guard lock(mutex_);
    return std::any_of(waiting_.begin(), waiting_.end(),
                       [](const auto& requests) { return !requests.empty(); });
  }

 private:
  struct Request {
    PlainSemaphore semaphore;
    std::atomic_flag isClaimed;  ///< Here nobody gives up, but the program could not know.
  };

  static std::size_t classOf(QoS qos) {
    if (qos == QoS::background) return 3;
    if (qos == QoS::utility) return 2;
    return qos == QoS::userInteractive ? 0 : 1;
  }
  [[nodiscard]] bool isHolder(std::thread::id thread) const {
    return std::find(holders_.begin(), holders_.end(), thread) != holders_.end();
  }

  std::mutex mutex_;
  std::vector<std::thread::id> holders_;
  std::array<std::deque<std::shared_ptr<Request>>, 4> waiting_;
};

/// The manager itself on a machine without disks, where all share the one place of the unknown one.
class Managed final {
 public:
  Managed() {
    begin(QoS::utility);
    disk_ = session()->diskData();
    end();
  }
  void begin(QoS qos) {
    std::unique_ptr<DiskAccessingSession>& current = session();
    current = manager_.beginAccessingURL(*volume_, "benchmark", qos, false, {}, volume_);
  }
  void end() { session()->endAccessing(); }
  [[nodiscard]] bool hasWaiter() {
    return disk_->queue().sync([&] { return disk_->requestCount() > 0; });
  }

 private:
  static std::unique_ptr<DiskAccessingSession>& session() {
    thread_local std::unique_ptr<DiskAccessingSession> current;
    return current;
  }

  const std::optional<URL> volume_ = URL::fileURLWithPath("/");
  Platform::Testing::FakeDeviceRegistry devices_;
  Platform::Testing::FakeDiskArbitration disks_;
  Platform::Testing::FakeVolumeCatalog volumes_;
  Platform::Testing::FakeSecurityScope scope_;
  Basalt::NotificationCenter center_;
  DiskAccessManager manager_{{.devices = devices_,
                              .disks = disks_,
                              .volumes = volumes_,
                              .securityScope = scope_,
                              .notificationCenter = center_}};
  std::shared_ptr<DiskData> disk_;
};

// A round of so many is over before others want the processor.
constexpr int callsARound = 5000;

void compareGrants() {
  const auto queue = std::make_shared<Basalt::SerialQueue>("benchmark");
  const auto disk = std::make_shared<DiskData>(
      std::make_shared<OVDiskInfo>("disk", OVDiskInfo::VolumeURLs(), OVDiskKindSolidState), false,
      queue);
  const Basalt::ThreadID thread = Basalt::currentThreadID();
  std::mutex mutex;
  volatile int counter = 0;
  std::size_t allocations = 0;
  const auto grantAndRelease = [&] {
    const std::size_t before = allocationCount();
    const Nanoseconds time = timeOfOne(callsARound, [&] {
      if (queue->sync([&] { return disk->requestAccess(thread, QoS::utility); })) std::abort();
      queue->sync([&] { disk->releaseAccess(thread); });
    });
    allocations += allocationCount() - before;
    return time;
  };
  const auto lockTwice = [&] {
    return timeOfOne(callsARound, [&] {
      for (int i = 0; i < 2; ++i) {
        const std::lock_guard lock(mutex);
        counter = counter + 1;
      }
    });
  };
  Comparison comparison;
  comparison.measure(1001, grantAndRelease, lockTwice);
  comparison.report("grant and release, free disk / two mutex pairs", 0.5, 1.3);
  if (allocations > 0) fmt::print("  allocations: {}\n", allocations);
}

void compareContention(int threadCount, const char* what) {
  Basalt::SerialQueue queue("benchmark");
  std::mutex mutex;
  volatile int counter = 0;
  constexpr int calls = 400'000;
  const auto inQueue = [&] {
    return timeOfOneAmong(threadCount, calls, [&] { queue.sync([&] { counter = counter + 1; }); });
  };
  const auto inMutex = [&] {
    return timeOfOneAmong(threadCount, calls, [&] {
      const std::lock_guard lock(mutex);
      counter = counter + 1;
    });
  };
  Comparison comparison;
  comparison.measure(25, inQueue, inMutex);
  comparison.report(what, 0.5, 0.8);
}

/// The waits of an urgent reader that comes again and again to a disk with three background
/// readers, each of which reads for a millisecond at a time.
template <typename Arbiter>
std::vector<Nanoseconds> urgentWaits(Arbiter& arbiter, int count) {
  std::atomic<bool> isOver = false;
  std::vector<std::thread> background;
  for (int i = 0; i < 3; ++i) {
    background.emplace_back([&] {
      while (!isOver) {
        arbiter.begin(QoS::background);
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
        arbiter.end();
      }
    });
  }
  std::vector<Nanoseconds> waits;
  for (int i = 0; i < count; ++i) {
    std::this_thread::sleep_for(std::chrono::microseconds(2000 + 37 * (i % 50)));
    waits.push_back(timeOf([&] { arbiter.begin(QoS::userInteractive); }));
    arbiter.end();
  }
  isOver = true;
  for (std::thread& thread : background) thread.join();
  return waits;
}

void compareUrgentReaders(Managed& managed) {
  FirstInFirstOut standIn;
  Comparison comparison;
  for (int round = 0; round < 8; ++round) {
    const auto append = [](auto& all, const auto& more) {
      all.insert(all.end(), more.begin(), more.end());
    };
    append(comparison.ours, urgentWaits(managed, 60));
    append(comparison.standIn, urgentWaits(standIn, 60));
  }
  comparison.report("urgent reader's wait, p50 / strict hand-over", 0.5, 0.25);
  comparison.report("urgent reader's wait, p99 / strict hand-over", 0.99, 0.4);
}

/// From the release of a place until the thread that slept for it has it.
template <typename Arbiter>
Nanoseconds handOver(Arbiter& arbiter) {
  using Time = std::chrono::steady_clock::time_point;
  Time admitted;
  arbiter.begin(QoS::utility);
  std::thread waiter([&] {
    arbiter.begin(QoS::utility);
    admitted = std::chrono::steady_clock::now();
    arbiter.end();
  });
  while (!arbiter.hasWaiter()) std::this_thread::yield();
  std::this_thread::sleep_for(std::chrono::microseconds(200));
  const Time released = std::chrono::steady_clock::now();
  arbiter.end();
  waiter.join();
  return std::chrono::duration<double, std::nano>(admitted - released).count();
}

void compareHandOver(Managed& managed) {
  PlainAdmission standIn;
  Comparison comparison;
  comparison.measure(
      4000, [&] { return handOver(managed); }, [&] { return handOver(standIn); });
  comparison.report("hand-over to a sleeping waiter, p50 / mutex + semaphore", 0.5, 1.0);
  comparison.report("hand-over to a sleeping waiter, p99 / mutex + semaphore", 0.99, 1.1);
}

}  // namespace
}  // namespace Varnel::Benchmarks

int main() {
  using namespace Varnel::Benchmarks;
  // From the first thread on, the C library locks in earnest.
  std::thread([] {}).join();
  compareGrants();
  compareContention(2, "serial section, 2 threads / mutex");
  compareContention(4, "serial section, 4 threads / mutex");
  Managed managed;
  compareUrgentReaders(managed);
  compareHandOver(managed);
}
