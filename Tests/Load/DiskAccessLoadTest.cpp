// SPDX-License-Identifier: MIT
#include <random>

#include <Tests/DiskAccess/DiskReadingFixture.h>
#include <Tests/Load/LoadTime.h>
#include <Tests/Support/Crew.h>

namespace Varnel {
namespace {

using namespace Tests;

/// Beside the disk under /home/ a rotating one, and a stick and a share that come and go.
class DiskAccessLoad : public DiskReadingFixture {
 protected:
  DiskAccessLoad() {
    plugDisk("HDD-1", "sda", "Rotational", archiveVolume);
    mount(archiveVolume);
    mount({.url = share, .isLocal = false, .isInternal = {}, .uuid = "SHARE"});
  }

  // Within another disk's session none waits without end: two could wait for one another.
  void access(std::minstd_rand& random, const URL& volume, unsigned depth) {
    constexpr std::optional<double> timeouts[] = {std::nullopt, -1, 0, 0.001, 0.005};
    const QoS classes[] = {QoS::userInteractive, QoS::userInitiated, QoS::default_, QoS::utility,
                           QoS::background};
    const DiskAccessGuard session(manager_->beginAccessingURL(
        volume, "load", classes[random() % 5], random() % 2 == 0,
        depth == 0 ? timeouts[random() % 5] : timeouts[1 + random() % 4], volume));
    if (!session) return;
    ++sessions_;
    if (depth < 3 && random() % 3 == 0) access(random, volumes[random() % 4], depth + 1);
    if (random() % 4 == 0) std::this_thread::yield();
  }

  void readInTurns(std::minstd_rand& random) {
    const URL& volume = volumes[random() % 4];
    const bool mayWait = random() % 2 == 0;
    const auto result =
        submit({.url = volume, .volumeURL = volume},
               {.propose = "load",
                .qos = random() % 2 == 0 ? QoS::background : QoS::userInitiated,
                .accessWaitingTimeout = mayWait ? std::nullopt : std::optional(0.002)},
               done)
            ->result();
    if (result == Result::read) ++turns_;
  }

  void disturb(std::minstd_rand& random) {
    switch (random() % 5) {
      case 0:
        return manager_->setIsBackgroundMode(random() % 2 == 0);
      case 1:
        return volumes_.unmount(random() % 2 == 0 ? stickVolume : share);
      case 2:
        return volumes_.mount(
            {.url = stickVolume, .isLocal = true, .isInternal = false, .uuid = "STICK"});
      case 3:
        return volumes_.mount({.url = share, .isLocal = false, .isInternal = {}, .uuid = "SHARE"});
      default:
        for (const auto& disk : manager_->snapshots()) EXPECT_FALSE(disk.places.empty());
    }
  }

  const URL share = URL::fileURLWithPath("/share/");
  const URL volumes[4] = {homeVolume, archiveVolume, stickVolume, share};
  std::atomic<std::uint64_t> sessions_ = 0;
  std::atomic<std::uint64_t> turns_ = 0;
};

TEST_F(DiskAccessLoad, EveryPlaceComesBackAndNobodyWaitsForEver) {
  const auto end = endOfLoad();
  Crew crew(64, [&](unsigned number) {
    std::minstd_rand random(number + 1);
    while (std::chrono::steady_clock::now() < end)
      if (number == 0)
        disturb(random);
      else if (number % 8 == 0)
        readInTurns(random);
      else
        access(random, volumes[random() % 4], 0);
  });
  crew.join();
  // The queue gives its places back soon after a result.
  while (!manager_->snapshots().empty()) std::this_thread::yield();
  EXPECT_GT(sessions_, 64u);
  EXPECT_GT(turns_, 0u);
  std::printf("%llu sessions, %llu turns\n", static_cast<unsigned long long>(sessions_.load()),
              static_cast<unsigned long long>(turns_.load()));
}

}  // namespace
}  // namespace Varnel
