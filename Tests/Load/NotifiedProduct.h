// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <random>
#include <set>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include <Tests/Load/NotificationModel.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Generic/NotificationDeliverer.h>
#include <Varnel/Platform/Generic/ScheduledNotificationCenter.h>
#include <Varnel/Platform/Generic/SharedWallClockTimer.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>
#include <Varnel/Platform/Testing/FakeNotificationServer.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeWallClockTimer.h>

namespace Varnel::Tests {

using namespace Platform;

struct Figures {
  int plans = 0, deliveries = 0, banners = 0, twice = 0, sleeps = 0, clockChanges = 0, travels = 0,
      outages = 0, locks = 0, kills = 0;
};

/// The machine, on which the notifier's clock, timer and queue are.
struct Machine {
  explicit Machine(std::uint32_t seed) : random(seed) { zones.local = "Europe/Berlin"; }

  std::size_t below(std::size_t count) { return random() % count; }

  std::mt19937 random;
  Testing::SimulatedClock clock{std::chrono::sys_days(std::chrono::year(2026) / 1 / 1)};
  Testing::FakeTimeZones zones = Tests::zonesOf2026();
  Testing::FakeMainQueue queue;
  const std::unique_ptr<PrivateFiles> files = POSIX::makePrivateFiles();
  Testing::CapturedSystemLog log;
  Testing::FakeWallClockTimer timer{clock};
  Figures figures;
};

/// A product with its store, its banners and its host, and what should have become of them.
class Product final : NotificationHosts, DelivererConnection {
 public:
  Product(Machine& machine, const std::string& file, bool isCoptic,
          std::function<void()> notifierIsWanted)
      : machine_(machine),
        almanac_{machine.zones, isCoptic},
        file_(file),
        notifierIsWanted_(std::move(notifierIsWanted)) {
    if (isCoptic) locale_.localeIdentifier = "en_US@calendar=coptic";
  }

  void begin(SharedWallClockTimer& timers) {
    for (auto& [identifier, each] : model_.deliveries) each.asked = machine_.clock.now();
    timer_ = timers.share();
    deliverer_.emplace(DelivererPorts{machine_.clock, locale_, machine_.zones, machine_.queue,
                                      *machine_.files, machine_.log, server, *timer_},
                       file_, Migrating::never, static_cast<NotificationHosts&>(*this));
    deliverer_->setDuty(NotificationDeliverer::Duty::everything);
  }

  /// Whoever is asked about a banner ends. What was not noted may come twice.
  void doubt() {
    compare();
    repeated_ = 0;
    for (auto& [identifier, each] : model_.deliveries)
      if (each.shown > each.settled) {
        each.maxShown = each.shown + 1;
        orphans_.insert(each.title);
      }
  }

  void kill() {
    doubt();
    deliverer_.reset();
    timer_.reset();
    server.report();
  }

  void changeServer(bool isToBeThere) {
    doubt();
    if (server.isPresent) server.disappear();
    orphans_.clear();
    if (isToBeThere) server.appear();
  }

  void travel() {
    model_.travel(almanac_);
    if (deliverer_) deliverer_->recheck();
  }

  /// Holds the lock of the store until the result goes.
  [[nodiscard]] SQLiteDatabase locked() {
    auto holder = SQLiteDatabase::open(file_);
    EXPECT_FALSE(holder->execute("BEGIN EXCLUSIVE"));
    return std::move(*holder);
  }

  void plan(int count = 1) {
    std::vector<UserNotification> notifications;
    for (; count > 0; --count) notifications.push_back(planned());
    EXPECT_FALSE(center_.change([&]() -> Failure {
      for (const UserNotification& each : notifications)
        if (auto error = center_.scheduleNotification(each)) return error;
      return std::nullopt;
    }));
  }

  void deliverAtOnce() {
    const std::string title = std::to_string(++titles_),
                      identifier = std::to_string(machine_.below(400));
    model_.deliver(identifier, title, machine_.clock.now());
    EXPECT_FALSE(center_.deliverNotification({.identifier = identifier, .title = title}));
  }

  void removeOne(bool isPlanned) {
    const std::string identifier = std::to_string(machine_.below(400));
    isPlanned ? model_.plans.erase(identifier) : model_.deliveries.erase(identifier);
    const UserNotification notification{.identifier = identifier};
    EXPECT_FALSE(isPlanned ? center_.removeScheduledNotification(notification)
                           : center_.removeDeliveredNotification(notification));
  }

  void setHost() { host_ = static_cast<Host>(machine_.below(4)); }

  // The user does something with a banner.
  void touch() {
    const auto banners = server.banners();
    if (banners.empty() || !deliverer_) return;
    auto banner = banners.begin();
    for (std::size_t i = machine_.below(banners.size()); i > 0; --i) ++banner;
    const std::string& title = banner->first;
    const std::size_t how = machine_.below(3);
    if (how == 0) return server.activate(title);
    if (how == 1) return server.expire(title);
    server.dismiss(title);
    std::erase_if(model_.deliveries, [&](auto& each) { return each.second.title == title; });
  }

  /// Whatever was seen until now is what should have been.
  void compare() {
    if (!deliverer_ || isLocked) return;
    model_.look(machine_.clock.now(), almanac_);
    for (const auto& [title, isToShow] : std::exchange(told_, {})) {
      auto* const delivery = model_.find(title);
      ASSERT_TRUE(delivery) << title << " came for nothing";
      ASSERT_FALSE(delivery->isToShow) << title << " was told twice";
      delivery->isToShow = isToShow;
      ++machine_.figures.deliveries;
      sinceDecision_ = 0;
    }
    for (; seen_ < server.history().size(); ++seen_) {
      const std::string& title = server.history()[seen_].title;
      auto* const delivery = model_.find(title);
      ASSERT_TRUE(delivery && delivery->isToShow == true) << title << " is not to be shown";
      ASSERT_LE(++delivery->shown, delivery->maxShown) << title;
      ++machine_.figures.banners;
      ++sinceDecision_;
      if (delivery->shown == 1) continue;
      ++machine_.figures.twice;
      ASSERT_LE(++repeated_, NotificationDeliverer::maxOnTheirWay);
    }
  }

  /// Nothing is left to be done before the timer rings.
  void compareSettled() {
    compare();
    if (!deliverer_ || isLocked) return;
    const Date now = machine_.clock.now();
    for (auto& [identifier, each] : model_.deliveries) {
      const bool isOpen =
          now >= each.asked && now < each.asked + NotificationDeliverer::maxQuestion;
      ASSERT_TRUE(each.isToShow || isOpen) << each.title << " was not delivered";
      ASSERT_TRUE(each.isToShow != true || each.shown > 0 || !server.isPresent) << each.title;
      each.settled = each.shown;
    }
    const auto& armed = deliverer_->earliestDate();
    for (const auto& [identifier, plan] : model_.plans) {
      ASSERT_TRUE(armed && *armed <= plan.date) << plan.title << " is not awaited";
    }
  }

  /// The lists say the same, and the file holds no more.
  void compareLists() {
    if (!deliverer_) return;
    const auto scheduled = center_.scheduledNotifications();
    ASSERT_TRUE(scheduled);
    std::map<std::string, Date> dates, expected;
    for (const auto& each : *scheduled) dates[*each.title] = *each.deliveryDate;
    for (const auto& [identifier, plan] : model_.plans) expected[plan.title] = plan.date;
    ASSERT_EQ(dates, expected);
    const auto delivered = center_.deliveredNotifications();
    ASSERT_TRUE(delivered);
    std::set<std::string> titles;
    for (const auto& each : *delivered) {
      ASSERT_TRUE(model_.find(*each.title)) << *each.title;
      titles.insert(*each.title);
    }
    std::size_t waiting = 0;
    std::erase_if(model_.deliveries, [&](const auto& each) {
      const NotificationModel::Delivery& delivery = each.second;
      const bool isListed = titles.contains(delivery.title);
      const bool isWaiting = delivery.isToShow.value_or(true) && delivery.shown == 0;
      waiting += isWaiting;
      const bool isOld = !isWaiting && delivery.order + maxDelivered / 2 < model_.count;
      EXPECT_TRUE(isListed || isOld) << delivery.title << " is not listed";
      return !isListed;
    });
    EXPECT_LE(titles.size(), maxDelivered + waiting + sinceDecision_);
    for (const auto& [title, banner] : server.banners()) {
      const auto* const delivery = model_.find(title);
      const bool mayBeUp = delivery && delivery->isToShow != false;
      EXPECT_TRUE(mayBeUp || orphans_.contains(title)) << title << " is up still";
    }
    std::int64_t rows = 0;
    std::optional<Date> first, last;
    auto database = SQLiteDatabase::open(file_, SQLiteDatabase::Access::readOnly);
    ASSERT_FALSE(database->row("SELECT count(*) FROM deliveries", std::tie(rows)));
    ASSERT_FALSE(
        database->row("SELECT min(clicked), max(clicked) FROM launches", std::tie(first, last)));
    EXPECT_EQ(static_cast<std::size_t>(rows), titles.size() + model_.plans.size());
    EXPECT_TRUE(!first || *last - *first < 2 * NotificationStore::maxLaunchAge);
  }

  [[nodiscard]] NotificationDeliverer& deliverer() { return *deliverer_; }
  Testing::FakeNotificationServer server;
  bool isLocked = false;

 private:
  enum class Host { absent, behind, inFront, hangs };
  static constexpr std::size_t maxDelivered = 100;

  // On some of the days to come, and from then on.
  UserNotification planned() {
    using namespace std::chrono_literals;
    using std::chrono::days;
    constexpr std::chrono::minutes timesOfDay[] = {2h + 30min, 8h, 8h, 9h + 15min, 18h, 20h};
    constexpr std::chrono::local_days changes[] = {
        std::chrono::local_days(2026y / 3 / 8), std::chrono::local_days(2026y / 3 / 29),
        std::chrono::local_days(2026y / 10 / 25), std::chrono::local_days(2026y / 11 / 1)};
    constexpr struct {
      int months, days, hours;
    } periods[] = {{0, 7, 0}, {0, 14, 0}, {1, 0, 0}, {1, 0, 0},   {3, 0, 0},
                   {6, 0, 0}, {12, 0, 0}, {1, 3, 0}, {0, 0, 500}, {0, 10, 30}};
    NotificationModel::Plan plan{.title = std::to_string(++titles_)};
    const auto today = std::chrono::floor<days>(almanac_.localOf(machine_.clock.now()));
    plan.origin = today + days(machine_.below(370)) + timesOfDay[machine_.below(6)];
    if (machine_.below(10) ==
        0)  // Somewhere the clocks change, and skip the time or show it twice.
      plan.origin =
          std::max<LocalTime>(today + days(1), changes[machine_.below(4)] + timesOfDay[0]);
    UserNotification notification{.title = plan.title,
                                  .deliveryDate = almanac_.dateOf(plan.origin)};
    plan.origin = almanac_.localOf(*notification.deliveryDate);
    if (machine_.below(6) == 0) {
      const auto& [months, days, hours] = periods[machine_.below(std::size(periods))];
      plan.months = months, plan.days = days, plan.hours = hours;
      notification.deliveryRepeatInterval =
          DateComponents{.month = months, .day = days, .hour = hours};
    }
    if (machine_.below(10) > 0) notification.identifier = std::to_string(machine_.below(400));
    model_.plan(notification.identifier.value_or("unique " + plan.title), plan, almanac_);
    ++machine_.figures.plans;
    return notification;
  }

  void shouldPresent(const UserNotification& notification,
                     std::function<void(bool)> answer) override {
    answers_[*notification.title] = host_ != Host::inFront;
    if (host_ != Host::hangs) answer(host_ != Host::inFront);
  }
  void didDeliver(const UserNotification& notification) override {
    told_.emplace_back(*notification.title, answers_.at(*notification.title));
  }
  void didActivate(const NotificationActivation& activation) override {
    EXPECT_FALSE(deliverer_->keepLaunch(activation));
  }

  void setHost(std::weak_ptr<NotificationHost>, Standing) override {}
  void setActive(bool) override {}
  void changed() override {
    notifierIsWanted_();
    deliverer_->recheck();
  }
  void changedAtOnce() override { changed(); }
  void checkBanners(std::function<void(const Failure&)>) override {}
  bool isBusy() const override { return false; }

  Machine& machine_;
  Testing::FakeUserLocale locale_;
  const Almanac almanac_;
  Host host_ = Host::absent;
  const std::string file_;
  const std::function<void()> notifierIsWanted_;
  Testing::FakeWallClockTimer pauses_{machine_.clock};
  ScheduledNotificationCenter center_{
      {machine_.clock, locale_, machine_.zones, *machine_.files, machine_.log, pauses_},
      file_,
      {.identifier = "com.example.Fotovia", .name = "Fotovia"},
      *this};
  NotificationModel model_;
  int titles_ = 0;
  std::map<std::string, bool> answers_;
  std::vector<std::pair<std::string, bool>> told_;
  std::size_t seen_ = 0;
  std::size_t sinceDecision_ = 0;  ///< Banners that have come since the list was last made short.
  std::set<std::string> orphans_;  ///< Of whose banners nobody may know the references.
  std::size_t repeated_ = 0;       ///< Banners that came again after the last end of somebody.
  std::unique_ptr<WallClockTimer> timer_;
  std::optional<NotificationDeliverer> deliverer_;
};

}  // namespace Varnel::Tests
