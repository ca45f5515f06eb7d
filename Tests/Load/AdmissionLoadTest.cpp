// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <map>
#include <random>

#include <Tests/Load/LoadTime.h>
#include <Tests/Support/Crew.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>

namespace Varnel {
namespace {

using Basalt::ThreadID;
using QoS = Platform::QualityOfService;

/// The rules of admission, in a form that is plainly right: who is in, and when a place was last
/// seen free. The queue of the disk owns it.
struct Model {
  [[nodiscard]] bool admitsAtOnce(ThreadID thread) const {
    return hasFreePlace() || in.contains(thread);
  }
  [[nodiscard]] bool hasFreePlace() const { return in.size() < limit; }
  // Only such a moment may let those in who wait.
  void note() {
    ++time;
    if (hasFreePlace()) lastFree = time;
  }

  std::multimap<ThreadID, int> in{};
  std::size_t limit = 0;
  std::uint64_t time = 0;
  std::uint64_t lastFree = 0;
};

/// A disk and the model of it, and a thread's way through both.
struct ModelledDisk {
  explicit ModelledDisk(OVDiskKind kind)
      : record(std::make_shared<DiskData>(
            std::make_shared<OVDiskInfo>("disk", OVDiskInfo::VolumeURLs(), kind), false,
            std::make_shared<Basalt::SerialQueue>("load"))) {
    model.limit = static_cast<std::size_t>(record->maxThreads());
  }

  [[nodiscard]] bool begin(QoS qos, std::optional<std::chrono::microseconds> timeout) {
    const ThreadID thread = Basalt::currentThreadID();
    std::uint64_t asked = 0;
    const auto request = record->queue().sync([&] {
      auto pending = record->requestAccess(thread, qos);
      EXPECT_EQ(!pending, model.admitsAtOnce(thread));
      model.note();
      asked = model.time;
      if (!pending) model.in.emplace(thread, 0);
      return pending;
    });
    if (!request) return true;
    const Platform::Date deadline =
        timeout ? Platform::Date(std::chrono::floor<std::chrono::microseconds>(
                      std::chrono::system_clock::now() + *timeout))
                : Platform::Date::max();
    if (!request->sema.waitUntil(deadline) && request->claim()) return false;
    record->queue().sync([&] {
      EXPECT_GT(model.lastFree, asked) << "nobody has left since";
      record->confirmAccess(thread);
      model.in.emplace(thread, 0);
    });
    return true;
  }

  void end() {
    record->queue().sync([&] {
      record->releaseAccess(Basalt::currentThreadID());
      model.in.erase(model.in.find(Basalt::currentThreadID()));
      model.note();
      EXPECT_EQ(record->accessCount(), model.in.size());
    });
  }

  void setIsBackgroundMode(bool isBackgroundMode) {
    record->queue().sync([&] {
      record->setIsBackgroundMode(isBackgroundMode);
      model.limit = static_cast<std::size_t>(record->maxThreads());
      model.note();
      if (!isBackgroundMode) record->grantPendingRequests();
    });
  }

  const std::shared_ptr<DiskData> record;
  Model model;
};

TEST(AdmissionLoad, LetsNobodyInAgainstTheRulesAndEverybodyInTheEnd) {
  ModelledDisk disks[] = {ModelledDisk(OVDiskKindSolidState), ModelledDisk(OVDiskKindRotational),
                          ModelledDisk(OVDiskKindExternal), ModelledDisk(OVDiskKindNetwork)};
  const auto end = Tests::endOfLoad();
  std::atomic<std::uint64_t> admissions = 0;
  std::atomic<std::uint64_t> timeouts = 0;
  Tests::Crew crew(64, [&](unsigned number) {
    std::minstd_rand random(number + 1);
    while (std::chrono::steady_clock::now() < end) {
      ModelledDisk& disk = disks[random() % 4];
      if (random() % 200 == 0) disk.setIsBackgroundMode(random() % 2 == 0);
      const QoS classes[] = {QoS::userInteractive, QoS::userInitiated, QoS::utility,
                             QoS::background};
      std::optional<std::chrono::microseconds> timeout;
      if (random() % 2 == 0) timeout = std::chrono::microseconds(random() % 2000);
      const std::size_t depth = 1 + random() % 3;
      std::size_t held = 0;
      while (held < depth && disk.begin(classes[random() % 4], timeout)) ++held;
      EXPECT_TRUE(held == 0 || held == depth) << "who is in comes in again";
      admissions += held;
      timeouts += held == 0;
      if (random() % 4 == 0) std::this_thread::yield();
      for (; held > 0; --held) disk.end();
    }
  });
  crew.join();
  for (ModelledDisk& disk : disks) {
    EXPECT_EQ(disk.record->queue().sync([&] { return disk.record->accessCount(); }), 0u);
    EXPECT_TRUE(disk.begin(QoS::background, std::chrono::microseconds(0)));
    disk.end();
  }
  std::printf("%llu admissions, %llu time-outs\n",
              static_cast<unsigned long long>(admissions.load()),
              static_cast<unsigned long long>(timeouts.load()));
}

}  // namespace
}  // namespace Varnel
