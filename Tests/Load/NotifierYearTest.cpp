// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <cstdio>

#include <Tests/Load/LoadTime.h>
#include <Tests/Load/NotifiedProduct.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Tests {
namespace {

using namespace std::chrono;
using namespace std::chrono_literals;

constexpr Date yearEnd = sys_days(2027y / January / 1);

class Year final {
 public:
  Year(std::uint32_t seed, int plans) : machine_(seed) {
    for (int i = 0; i < plans / 25; ++i)
      products_.push_back(
          std::make_unique<Product>(machine_, folder_.path() / (std::to_string(i) + ".sqlite"),
                                    i % 2 > 0, [this] { begin(); }));
    while (machine_.figures.plans < plans) any().plan(10);
    settle();
  }

  void pass() {
    for (int i = 1; machine_.clock.now() - error_ < yearEnd; ++i) {
      step(machine_.below(100));
      settle();
      if (i % 10 == 0)
        for (const auto& product : products_) product->compareLists();
      if (::testing::Test::HasFailure()) return;
    }
    // With the server all banners go, and the notifier would stay for none.
    trouble_ = nullptr;
    begin();
    changeServer(false);
    settle();
    stayAwakeUntil(machine_.clock.now() + NotificationDeliverer::maxQuestion);
    for (const auto& product : products_) EXPECT_TRUE(product->deliverer().isQuiet());
  }

  [[nodiscard]] const Figures& figures() const { return machine_.figures; }

 private:
  // In hundredths of all that happens.
  void step(std::size_t what) {
    const bool isServerThere = products_.front()->server.isPresent;
    if (!isServerThere && machine_.below(3) == 0) changeServer(true);
    const Date now = machine_.clock.now();
    const auto upTo = [&](hours max) {
      return minutes(1 + machine_.below(static_cast<std::size_t>(minutes(max).count())));
    };
    if (what < 40) return stayAwakeUntil(now + upTo(isServerThere ? 36h : 2h));
    if (what < 50) return sleepUntil(now + upTo(48h));
    if (what < 56) return setClock(now + upTo(48h) - upTo(48h));
    if (what < 57) return setWrongClock();
    if (what < 60) return travel();
    if (what < 64) return endSoon([this] { changeServer(machine_.below(2) == 0); });
    if (what < 70) return any().setHost();
    if (what < 80) return any().plan();
    if (what < 84) return any().deliverAtOnce();
    if (what < 88) return any().removeOne(machine_.below(2) == 0);
    if (what < 95) return touch();
    if (what < 96) return lockAStore();
    if (what < 98) return begin();
    endSoon([this] { kill(); });
  }

  // Some have much to tell.
  Product& any() { return *products_[machine_.below(1 + machine_.below(products_.size()))]; }

  // A kill at this moment loses what the user has done.
  void touch() {
    trouble_ = nullptr;
    any().touch();
  }

  void begin() {
    if (timers_) return;
    timers_.emplace(machine_.clock, machine_.timer);
    for (const auto& product : products_) product->begin(*timers_);
  }

  void kill() {
    if (!timers_) return;
    ++machine_.figures.kills;
    for (const auto& product : products_) product->kill();
    timers_.reset();
    machine_.queue.drain();
  }

  void changeServer(bool isToBeThere) {
    ++machine_.figures.outages;
    for (const auto& product : products_) product->changeServer(isToBeThere);
  }

  // In the midst of something.
  void endSoon(std::function<void()> trouble) { trouble_ = std::move(trouble); }

  // Until the servers and the main queue have nothing left to do.
  void settle() {
    do {
      if (trouble_ && machine_.below(3) == 0) std::exchange(trouble_, nullptr)();
      for (const auto& product : products_) product->server.report();
    } while (machine_.queue.drain());
    for (const auto& product : products_) product->compareSettled();
  }

  void stayAwakeUntil(Date end) {
    const auto& armed = machine_.timer.armedDate();
    for (int rings = 0; armed && *armed <= end; ++rings) {
      if (*armed > machine_.clock.now()) rings = 0;
      ASSERT_LT(rings, 10) << "the timer rings again and again";
      machine_.timer.setClock(std::max(machine_.clock.now(), *armed));
      settle();
      if (::testing::Test::HasFailure()) return;
    }
    machine_.clock.set(end);
  }

  void sleepUntil(Date end) {
    ++machine_.figures.sleeps;
    machine_.clock.set(end);
    stayAwakeUntil(end);
  }

  void setClock(Date date) {
    ++machine_.figures.clockChanges;
    machine_.timer.setClock(date);
  }

  // Or right again.
  void setWrongClock() {
    const days before = std::exchange(error_, days(40) - error_);
    setClock(machine_.clock.now() + (error_ - before));
  }

  void travel() {
    ++machine_.figures.travels;
    constexpr const char* names[] = {"Europe/Berlin", "America/New_York", "Asia/Tokyo"};
    machine_.zones.local = names[machine_.below(3)];
    for (const auto& product : products_) product->travel();
  }

  // Then what was tried in vain is tried again.
  void lockAStore() {
    ++machine_.figures.locks;
    Product& product = any();
    product.isLocked = true;
    {
      const SQLiteDatabase holder = product.locked();
      stayAwakeUntil(machine_.clock.now() + 20s);
    }
    stayAwakeUntil(machine_.clock.now() + NotificationDeliverer::maxPause);
    product.isLocked = false;
  }

  const TemporaryFolder folder_ = Tests::TemporaryFolder::inMemory();
  Machine machine_;
  std::optional<SharedWallClockTimer> timers_;  ///< While there is a notifier.
  std::vector<std::unique_ptr<Product>> products_;
  std::function<void()> trouble_;
  days error_{};  ///< By which the clock is wrong, beside what is set by hand.
};

// Nothing comes before its date, for nothing or twice, and nothing is lost, but as the model says.
TEST(NotifierYear, DeliversAThousandPlansWhateverHappensToTheMachine) {
  const auto end = endOfLoad();
  const int plans = isLongLoad() ? 1000 : 200;
  for (std::uint32_t seed = 1; seed == 1 || steady_clock::now() < end; ++seed) {
    const ::testing::Message message = ::testing::Message() << "seed " << seed;
    SCOPED_TRACE(message);
    Year year(seed, plans);
    year.pass();
    const Figures& its = year.figures();
    std::printf(
        "seed %u: %d plans, %d deliveries, %d banners (%d again), %d sleeps, %d clock changes, %d "
        "travels, %d changes of the server, %d locks, %d kills\n",
        seed, its.plans, its.deliveries, its.banners, its.twice, its.sleeps, its.clockChanges,
        its.travels, its.outages, its.locks, its.kills);
    if (HasFailure()) return;
    EXPECT_GT(its.deliveries, plans);
  }
}

}  // namespace
}  // namespace Varnel::Tests
