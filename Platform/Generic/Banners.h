// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Ports/NotificationServer.h>

namespace Varnel::Platform {

/// Brings the desktop's banners in step with the store, and notes in the store what becomes of
/// them.
///
/// What could not be noted is kept and noted later, in order, so that no banner is shown twice.
/// Main thread only.
class Banners final : public NotificationServer::Observer {
 public:
  using Failure = NotificationStore::Failure;

  struct Events {
    std::function<void()> changed;  ///< There is something to note or to show.
    std::function<void(const NotificationActivation& activation)> activated;
  };

  /// The server and the store outlive this.
  Banners(NotificationServer& server, NotificationStore& store, Events events);

  /// Notes what was not noted yet.
  [[nodiscard]] Failure catchUp();

  /// Forgets what was not noted yet, where there is nothing to note it in.
  void dropNotes() { notes_.clear(); }

  /// Closes what the store says and, if that may be, shows the next `max` that it says.
  [[nodiscard]] Failure follow(const std::vector<Delivery>& all, bool mayShow, std::size_t max);

  /// Whether that would show this one.
  [[nodiscard]] bool isToShow(const Delivery& delivery) const;

  /// Those that failed are left alone until this is called.
  void tryFailedAgain() { failed_.clear(); }
  [[nodiscard]] bool hasFailed() const { return !failed_.empty(); }

  [[nodiscard]] std::size_t onTheirWay() const { return onTheirWay_.size(); }
  /// Whether none is up or on its way, and nothing has to be noted.
  [[nodiscard]] bool isIdle() const;
  /// Whose banners it has shown; none before the first.
  [[nodiscard]] const std::optional<NotificationSource>& source() const { return source_; }

  void bannerShown(const std::string& token, const std::string& reference) override;
  void bannerFailed(const std::string& token) override;
  void bannerActivated(const std::string& token, const BannerActivation& activation) override;
  void bannerDismissed(const std::string& token) override;
  void bannerGone(const std::string& token) override;
  void serverAppeared() override;

 private:
  /// What became of a banner.
  struct Note {
    std::int64_t number;
    std::optional<std::string> reference;  ///< It is shown; otherwise it is gone.
    bool isDismissed = false;
  };

  [[nodiscard]] Failure write(const Note& note, std::vector<Note>& orphans);
  void note(Note note);
  void gone(std::int64_t number, bool isDismissed);
  void show(const Delivery& delivery);
  void close(const Delivery& delivery);

  NotificationServer& server_;
  NotificationStore& store_;
  const Events events_;
  std::optional<NotificationSource> source_;

  /// By this object, or about to be; also expired ones, which the user may bring back and click.
  std::map<std::int64_t, UserNotification> shown_;
  std::set<std::int64_t> onTheirWay_;  ///< The server has not answered.
  std::set<std::int64_t> up_;
  std::set<std::int64_t> closing_;
  std::set<std::int64_t> failed_;
  std::vector<Note> notes_;
};

}  // namespace Varnel::Platform
