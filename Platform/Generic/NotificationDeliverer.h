// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Generic/DelivererPorts.h>
#include <Varnel/Platform/Generic/NotificationHosts.h>
#include <Varnel/Platform/Generic/NotificationStore.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Varnel::Platform {

class Banners;
class Calendar;
class FileLock;

/// Delivers the notifications of one product: makes due what its store has planned, asks whether to
/// show it, and keeps the desktop's banners in step with the store.
///
///     NotificationDeliverer deliverer(ports, storeFile, Migrating::never, hosts);
///     deliverer.setDuty(NotificationDeliverer::Duty::everything);
///     …
///     deliverer.recheck();  // the store has changed
///
/// Of several on one store the first with something to deliver does so until it ends; it holds a
/// lock on a file beside the store. What cannot be done, because of the store, of the lock or of
/// the server, is tried again, after pauses that grow from `minPause` to `maxPause`, and at once
/// when a server appears or `recheck` is called. Main thread only.
class NotificationDeliverer final {
 public:
  using Failure = NotificationStore::Failure;

  static constexpr std::chrono::seconds minPause{1};
  static constexpr std::chrono::minutes maxPause{5};
  /// How long a host may think about whether to show a notification, which is then shown.
  static constexpr std::chrono::seconds maxQuestion{2};
  /// How many banners are on their way to the server at once. So many may come twice when the
  /// process is killed.
  static constexpr std::size_t maxOnTheirWay = 20;

  using Ports = DelivererPorts;

  /// What it does, beyond taking away the banners of what was removed.
  enum class Duty {
    nothing,
    due,        ///< Delivers what is due already.
    everything  ///< Makes due what is planned, too.
  };

  /// `hosts` outlives the deliverer. Nothing is done, nor the store opened, before the first call.
  /// Who may not migrate the store does not make one either: where the file is gone, all is done.
  NotificationDeliverer(const Ports& ports, const std::string& storeFile, Migrating migrating,
                        NotificationHosts& hosts);
  ~NotificationDeliverer();
  NotificationDeliverer(const NotificationDeliverer&) = delete;
  NotificationDeliverer& operator=(const NotificationDeliverer&) = delete;

  /// `nothing` until this is called. Rechecks.
  void setDuty(Duty duty);

  /// To be called when something outside may have changed what is to be done: the store, or the
  /// user's time zone.
  void recheck();

  /// Whether nothing is left for it to do, now or later: it is quiet, and nothing is planned, due
  /// or to be shown. So it is, too, where the store is not its to use: of another format, or not
  /// the user's.
  [[nodiscard]] bool isIdle() const;
  /// Whether another one may take its place, and nobody misses a click: no banner of it is up, and
  /// nothing is under way.
  [[nodiscard]] bool isQuiet() const;
  /// Whether something is on its way to the server or the store. Becomes false in the end, also
  /// without a server, but not while one has taken a banner and hangs.
  [[nodiscard]] bool isBusy() const;
  /// When it wants to go on, if nothing else happens; its timer waits for that.
  [[nodiscard]] const std::optional<Date>& earliestDate() const { return next_; }

  /// Keeps a click for the application that is about to be started for it.
  [[nodiscard]] Failure keepLaunch(const NotificationActivation& activation);

  /// Who plans in this store; none before anything was planned. Where the store cannot be read:
  /// whose banners were shown.
  [[nodiscard]] Result<std::optional<NotificationSource>> source();

 private:
  /// Whether to show a delivery, as its host was asked.
  struct Question {
    Date asked;
    std::optional<bool> answer;
  };

  [[nodiscard]] bool isStoreThere() const;
  [[nodiscard]] Failure follow();
  [[nodiscard]] Failure deliver();
  [[nodiscard]] Failure becomeDeliverer(const std::vector<Delivery>& all, Date now);
  void ask(const std::vector<Delivery>& all);
  void take(std::int64_t number, bool isToShow);
  [[nodiscard]] bool isOverdue(const Question& question) const;
  [[nodiscard]] Failure decide();
  void lookAhead(const std::vector<Delivery>& all);
  void report(const Failure& failure);
  void recheckSoon();
  void tick();
  void awaitNext();
  [[nodiscard]] Calendar calendar() const;

  const Ports ports_;
  const std::string storeFile_;
  const Migrating migrating_;
  NotificationHosts& hosts_;
  std::optional<NotificationStore> store_;
  /// What is called later finds it gone when the deliverer has ended.
  const std::shared_ptr<Banners> banners_;
  Duty duty_ = Duty::nothing;
  std::unique_ptr<FileLock> lock_;
  std::map<std::int64_t, Question> questions_;  ///< By the number of the delivery, which is due.

  bool isOccupied_ = false;  ///< A recheck is under way.
  bool isPosted_ = false;    ///< And another one will follow.
  bool isBehind_ = false;    ///< Something is left that the last recheck should have done.
  bool isAllDone_ = false;   ///< The store holds nothing to be done, or is not to be used.
  std::optional<Date> nextPlanned_;
  std::optional<Date> next_;
  std::optional<Date> busySince_;  ///< The store is locked.
  std::string lastReport_;
  bool isToRetry_ = false;  ///< When the pause is over.
  GrowingPause pause_{minPause, maxPause};
};

}  // namespace Varnel::Platform
