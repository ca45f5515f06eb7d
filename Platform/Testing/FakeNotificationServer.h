// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A notification server that shows its banners to the test, which acts as the user.
///
///     FakeNotificationServer server;
///     …
///     server.report();
///     EXPECT_EQ(server.banners().at("Hello").text, "How are you?");
///     server.activate("Hello");
///
/// Banners are told by their titles. One thread.
class FakeNotificationServer final : public NotificationServer {
 public:
  /// Whether there is one. `appear` and `disappear` let the center know of a change.
  bool isPresent = true;
  /// A request to show or to close that goes wrong is answered with an error. All answers are late:
  /// see `report`.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  /// The product that its banners come from.
  NotificationSource source;

  void setObserver(std::weak_ptr<Observer> observer) override { observer_ = std::move(observer); }
  void setSource(const NotificationSource& present) override { source = present; }

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) override {
    if (!isPresent || isRefused()) return answerLater(&Observer::bannerFailed, token);
    if (replacedReference) banners_.erase(*replacedReference);
    const std::string reference = std::to_string(++lastReference_);
    banners_[reference] = {token, banner};
    history_.push_back(banner);
    answers_.emplace_back([this, reference] {
      const auto shown = banners_.find(reference);
      if (shown == banners_.end()) return;
      shown->second.isReported = true;
      if (const auto observer = observer_.lock())
        observer->bannerShown(std::string(shown->second.token), reference);
    });
  }

  void close(const std::string& token, const std::optional<std::string>& reference) override {
    // Without a server there are no banners any more.
    if (isPresent && isRefused()) return answerLater(&Observer::bannerFailed, token);
    if (reference) banners_.erase(*reference);
    std::erase_if(banners_, [&](const auto& each) { return each.second.token == token; });
    answerLater(&Observer::bannerGone, token);
  }

  void check(std::function<void(const std::optional<PlatformError>&)> answer) override {
    std::optional<PlatformError> obstacle;
    if (!isPresent) obstacle = PlatformError(std::make_error_code(std::errc::no_such_process));
    answers_.emplace_back([answer = std::move(answer), obstacle] { answer(obstacle); });
  }

  [[nodiscard]] bool isBusy() const override { return !answers_.empty(); }

  /// Lets the center know what has been done since the last call, as a server does, later.
  void report() {
    while (!answers_.empty()) {
      const auto answer = std::move(answers_.front());
      answers_.pop_front();
      answer();
    }
  }

  /// Acts as a server that was started. What failed before is reported before, as on a bus.
  void appear() {
    report();
    isPresent = true;
    if (const auto observer = observer_.lock()) observer->serverAppeared();
  }
  /// Acts as a server that has ended, and all its banners with it. What it had not reported has
  /// failed.
  void disappear() {
    isPresent = false;
    for (const auto& [reference, gone] : std::exchange(banners_, {}))
      if (!gone.isReported)
        answerLater(&Observer::bannerFailed, gone.token);
      else if (!gone.isExpired)
        tell(&Observer::bannerGone, gone.token);
  }

  /// How many banners the user sees.
  [[nodiscard]] std::size_t count() const {
    return static_cast<std::size_t>(std::count_if(
        banners_.begin(), banners_.end(), [](const auto& each) { return !each.second.isExpired; }));
  }
  /// Those banners, by title.
  [[nodiscard]] std::map<std::string, Banner> banners() const {
    std::map<std::string, Banner> banners;
    for (const auto& [reference, each] : banners_)
      if (!each.isExpired) banners[each.banner.title] = each.banner;
    return banners;
  }
  /// Every banner that was ever shown, oldest first.
  [[nodiscard]] const std::vector<Banner>& history() const { return history_; }

  /// Acts as the user, who may also click a banner that has expired. What the server has done until
  /// now is reported before.
  void activate(const std::string& title, const BannerActivation& activation = {}) {
    if (const auto token = take(title))
      if (const auto observer = observer_.lock()) observer->bannerActivated(*token, activation);
  }
  void dismiss(const std::string& title) {
    if (const auto token = take(title))
      if (const auto observer = observer_.lock()) observer->bannerDismissed(*token);
  }

  /// Acts as a server whose banner has been there long enough.
  void expire(const std::string& title) {
    report();
    const auto expired = find(title);
    if (expired == banners_.end() || std::exchange(expired->second.isExpired, true)) return;
    tell(&Observer::bannerGone, std::string(expired->second.token));
  }

 private:
  struct Shown {
    std::string token;
    Banner banner;
    bool isReported = false;
    bool isExpired = false;
  };
  using Event = void (Observer::*)(const std::string& token);

  bool isRefused() { return faults->next() != Fault::none; }

  void tell(Event event, const std::string& token) const {
    if (const auto observer = observer_.lock()) ((*observer).*event)(token);
  }
  void answerLater(Event event, const std::string& token) {
    answers_.emplace_back([this, event, token] { tell(event, token); });
  }

  std::map<std::string, Shown>::iterator find(const std::string& title) {
    return std::find_if(banners_.begin(), banners_.end(),
                        [&](const auto& each) { return each.second.banner.title == title; });
  }
  std::optional<std::string> take(const std::string& title) {
    report();
    const auto found = find(title);
    if (found == banners_.end()) return std::nullopt;
    return banners_.extract(found).mapped().token;
  }

  std::weak_ptr<Observer> observer_;
  std::map<std::string, Shown> banners_;  ///< By reference.
  std::vector<Banner> history_;
  std::deque<std::function<void()>> answers_;
  int lastReference_ = 0;
};

}  // namespace Varnel::Platform::Testing
