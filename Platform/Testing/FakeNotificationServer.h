// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/NotificationServer.h>

namespace Varnel::Platform::Testing {

/// A notification server that shows its banners to the test, which acts as the user.
///
///     FakeNotificationServer server;
///     …
///     EXPECT_EQ(server.banners().at("token").title, "Hello");
///     server.activate("token");
///
/// One thread. Several centers may share one, as several processes share a desktop's.
class FakeNotificationServer final : public NotificationServer {
 public:
  /// While false, `show` does nothing, as without a server.
  bool isPresent = true;

  void setObserver(std::weak_ptr<Observer> observer) override { observer_ = std::move(observer); }

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) override {
    if (!isPresent) return;
    if (replacedReference) remove(*replacedReference);
    const std::string reference = std::to_string(++lastReference_);
    references_[reference] = token;
    banners_[token] = banner;
    history_.push_back(banner);
    unreported_.emplace_back(token, reference);
  }

  void close(const std::string& token, const std::optional<std::string>& reference) override {
    if (reference) remove(*reference);
    banners_.erase(token);
  }

  [[nodiscard]] bool isBusy() const override { return !unreported_.empty(); }

  /// Lets the center know what has been shown since the last call, as a server does, later.
  void report() {
    for (const auto& [token, reference] : std::exchange(unreported_, {}))
      if (const auto observer = observer_.lock()) observer->bannerShown(token, reference);
  }

  /// The banners that the user sees, by token.
  [[nodiscard]] const std::map<std::string, Banner>& banners() const { return banners_; }
  /// Every banner that was ever shown, oldest first.
  [[nodiscard]] const std::vector<Banner>& history() const { return history_; }

  void activate(const std::string& token) {
    if (banners_.erase(token) == 0) return;
    if (const auto observer = observer_.lock()) observer->bannerActivated(token);
  }
  void dismiss(const std::string& token) {
    if (banners_.erase(token) == 0) return;
    if (const auto observer = observer_.lock()) observer->bannerDismissed(token);
  }

 private:
  void remove(const std::string& reference) {
    const auto found = references_.find(reference);
    if (found == references_.end()) return;
    banners_.erase(found->second);
    references_.erase(found);
  }

  std::weak_ptr<Observer> observer_;
  std::map<std::string, Banner> banners_;
  std::map<std::string, std::string> references_;  ///< Tokens by reference.
  std::vector<Banner> history_;
  std::vector<std::pair<std::string, std::string>> unreported_;
  int lastReference_ = 0;
};

}  // namespace Varnel::Platform::Testing
