// SPDX-License-Identifier: MIT
#pragma once

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
  /// Whether there is one. `appear` lets the center know of a change.
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
    if (!works()) return answers_.push_back([token](Observer& told) { told.bannerFailed(token); });
    if (replacedReference) shown_.erase(*replacedReference);
    const std::string reference = std::to_string(++lastReference_);
    shown_[reference] = {token, banner};
    history_.push_back(banner);
    answers_.push_back([token, reference](Observer& told) { told.bannerShown(token, reference); });
  }

  void close(const std::string& token, const std::optional<std::string>& reference) override {
    if (!works()) return answers_.push_back([token](Observer& told) { told.bannerFailed(token); });
    if (reference) shown_.erase(*reference);
    std::erase_if(shown_, [&](const auto& each) { return each.second.token == token; });
    answers_.push_back([token](Observer& told) { told.bannerGone(token); });
  }

  void check(std::function<void(const std::optional<PlatformError>&)> answer) override {
    answers_.push_back([answer = std::move(answer), isPresent = isPresent](Observer&) {
      if (isPresent)
        answer(std::nullopt);
      else
        answer(PlatformError(std::make_error_code(std::errc::no_such_process)));
    });
  }

  [[nodiscard]] bool isBusy() const override { return !answers_.empty(); }

  /// Lets the center know what has been done since the last call, as a server does, later.
  void report() {
    while (!answers_.empty())
      for (const auto& answer : std::exchange(answers_, {}))
        if (const auto observer = observer_.lock()) answer(*observer);
  }

  /// Acts as a server that was started.
  void appear() {
    isPresent = true;
    if (const auto observer = observer_.lock()) observer->serverAppeared();
  }
  /// Acts as a server that has ended, and all its banners with it.
  void disappear() {
    isPresent = false;
    for (const auto& [reference, gone] : std::exchange(shown_, {}))
      if (const auto observer = observer_.lock()) observer->bannerGone(gone.token);
  }

  /// How many banners the user sees.
  [[nodiscard]] std::size_t count() const { return shown_.size(); }
  /// Those banners, by title.
  [[nodiscard]] std::map<std::string, Banner> banners() const {
    std::map<std::string, Banner> banners;
    for (const auto& [reference, each] : shown_) banners[each.banner.title] = each.banner;
    return banners;
  }
  /// Every banner that was ever shown, oldest first.
  [[nodiscard]] const std::vector<Banner>& history() const { return history_; }

  void activate(const std::string& title, const BannerActivation& activation = {}) {
    if (const auto token = take(title))
      if (const auto observer = observer_.lock()) observer->bannerActivated(*token, activation);
  }
  void dismiss(const std::string& title) {
    if (const auto token = take(title))
      if (const auto observer = observer_.lock()) observer->bannerDismissed(*token);
  }

 private:
  struct Shown {
    std::string token;
    Banner banner;
  };

  bool works() { return isPresent && faults->next() == Fault::none; }

  std::optional<std::string> take(const std::string& title) {
    for (auto each = shown_.begin(); each != shown_.end(); ++each)
      if (each->second.banner.title == title) return shown_.extract(each).mapped().token;
    return std::nullopt;
  }

  std::weak_ptr<Observer> observer_;
  std::map<std::string, Shown> shown_;  ///< By reference.
  std::vector<Banner> history_;
  std::vector<std::function<void(Observer&)>> answers_;
  int lastReference_ = 0;
};

}  // namespace Varnel::Platform::Testing
