// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/NotificationServer.h>

#include <cstdint>
#include <functional>
#include <map>
#include <string_view>
#include <utility>
#include <vector>

#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Values/NotificationSource.h>

namespace Varnel::Platform::Linux {
namespace {

// What the server's replies and signals refer to. Replies may outlive the adapter.
class Desktop final : public std::enable_shared_from_this<Desktop> {
 public:
  Desktop(SystemLog& systemLog, NotificationSource first, std::shared_ptr<SessionBus> bus)
      : source(std::move(first)),
        systemLog_(systemLog),
        bus_(std::move(bus)),
        signals_(bus_->listen({notificationService, notificationService, nullptr, notificationPath},
                              [this](const char* sender, const char* name, GVariant* body) {
                                receive(sender, name, body);
                              })),
        servers_(bus_->watch(notificationService,
                             [this](const std::string& before, const std::string& after) {
                               replaceServer(before, !after.empty());
                             })) {}

  std::weak_ptr<NotificationServer::Observer> observer;
  NotificationSource source;

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) {
    const auto replaced =
        replacedReference ? BannerAddress::parse(*replacedReference) : std::nullopt;
    if (replaced) take(*replaced);
    shown_.insert_or_assign(token, Shown());
    // Asked each time, because another server may have taken its place.
    ask(capabilitiesRequest(), token, SessionBus::usualTime,
        [token, banner, replaced](Desktop& self, GDBusMessage* reply) {
          self.notify(token, banner, replaced, g_dbus_message_get_sender(reply),
                      capabilitiesIn(reply));
        });
  }

  void close(const std::string& token, const std::optional<std::string>& reference) {
    auto address = reference ? BannerAddress::parse(*reference) : std::nullopt;
    if (const auto shown = shown_.extract(token); shown && shown.mapped().address)
      address = shown.mapped().address;
    ++pending_;
    bus_->connect([weak = weak_from_this(), token, address](const BusFailure* failure) {
      const auto self = weak.lock();
      if (!self) return;
      --self->pending_;
      if (failure) return self->tell(&NotificationServer::Observer::bannerFailed, token);
      // The server of another session has gone with its banners; then the bus alone is asked, so
      // that the answer comes later.
      const bool isHere = address && address->bus == self->bus_->name();
      self->send(isHere ? closeRequest(*address) : pingOfBus(), SessionBus::usualTime,
                 // Whatever the server says: it does not matter whether it was still there.
                 [token](Desktop& asked, GDBusMessage*, const BusFailure&) {
                   asked.tell(&NotificationServer::Observer::bannerGone, token);
                 });
    });
  }

  void check(std::function<void(const std::optional<PlatformError>&)> answer) {
    send(capabilitiesRequest(), SessionBus::usualTime,
         [answer = std::move(answer)](Desktop&, GDBusMessage* reply, const BusFailure& failure) {
           if (reply) return answer(std::nullopt);
           answer(PlatformError(notificationService, 0,
                                {{std::string(localizedDescriptionKey), failure.text}}));
         });
  }

  bool isBusy() const { return pending_ > 0; }

 private:
  using Event = void (NotificationServer::Observer::*)(const std::string& token);
  struct Shown {
    std::optional<BannerAddress> address = std::nullopt;  ///< Once the server has answered.
    std::string activationToken = {};                     ///< Comes before the click.
    bool isExpired = false;
  };

  void tell(Event event, const std::string& token) const {
    if (const auto told = observer.lock()) ((*told).*event)(token);
  }

  template <typename Use>
  void send(BusMessage message, std::chrono::milliseconds time, Use use) {
    ++pending_;
    bus_->ask(std::move(message), time,
              [weak = weak_from_this(), use](GDBusMessage* reply, const BusFailure& failure) {
                const auto self = weak.lock();
                if (!self) return;
                --self->pending_;
                use(*self, reply, failure);
              });
  }

  // What fails is the banner with this token.
  template <typename Use>
  void ask(BusMessage message, const std::string& token, std::chrono::milliseconds time, Use use) {
    send(std::move(message), time,
         [token, use](Desktop& self, GDBusMessage* reply, const BusFailure& failure) {
           reply ? use(self, reply) : self.fail(token, failure.text);
         });
  }

  void fail(const std::string& token, const std::string& error) {
    // Said once, not at each new try.
    if (error != std::exchange(lastError_, error))
      systemLog_.write("Cannot show a notification: " + error);
    if (shown_.erase(token) > 0) tell(&NotificationServer::Observer::bannerFailed, token);
  }

  // A server that hangs has taken the banner and shows it when it goes on. So nobody gives up
  // waiting: the bus answers when the server ends.
  void notify(const std::string& token, const Banner& banner,
              const std::optional<BannerAddress>& replaced, const std::string& server,
              ServerCapabilities capabilities) {
    if (!shown_.contains(token)) return;
    const bool knowsIt = replaced && replaced->bus == bus_->name() && replaced->server == server;
    ask(notifyRequest(server, source, banner, capabilities, knowsIt ? replaced->number : 0), token,
        SessionBus::unlimitedTime, [token, server](Desktop& self, GDBusMessage* reply) {
          const auto number = bannerNumberIn(reply);
          if (!number) return self.fail(token, "The notification server gives no number.");
          self.hasShown(token, {self.bus_->name(), server, *number});
        });
  }

  void hasShown(const std::string& token, const BannerAddress& address) {
    lastError_.clear();
    const auto shown = shown_.find(token);
    // The banner was closed before the server had answered.
    if (shown == shown_.end()) return closeQuietly(address);
    shown->second.address = address;
    if (const auto told = observer.lock()) told->bannerShown(token, address.reference());
  }

  void closeQuietly(const BannerAddress& address) {
    send(closeRequest(address), SessionBus::usualTime,
         [](Desktop&, GDBusMessage*, const BusFailure&) {});
  }

  void receive(const char* sender, std::string_view name, GVariant* body) {
    const auto signal = bannerSignalIn(name, body);
    if (!signal) return;
    const BannerAddress address{bus_->name(), sender, signal->number};
    switch (signal->kind) {
      case BannerSignal::Kind::invoked:
        return invoke(address, signal->text);
      case BannerSignal::Kind::token:
        return keepToken(address, signal->text);
      case BannerSignal::Kind::closed:
        return close(address, signal->reason);
    }
  }

  // The banner's token and what is known of it, once: further signals for the same banner are
  // ignored.
  std::optional<std::pair<std::string, Shown>> take(const BannerAddress& address) {
    for (auto shown = shown_.begin(); shown != shown_.end(); ++shown) {
      if (shown->second.address != address) continue;
      auto taken = shown_.extract(shown);
      return std::pair(taken.key(), std::move(taken.mapped()));
    }
    return std::nullopt;
  }

  void keepToken(const BannerAddress& address, const std::string& activationToken) {
    for (auto& [token, shown] : shown_)
      if (shown.address == address) shown.activationToken = activationToken;
  }

  void invoke(const BannerAddress& address, std::string_view action) {
    const auto taken = take(address);
    if (!taken) return;
    // Not every server closes the banner by itself.
    closeQuietly(address);
    if (action == dismissAction)
      return tell(&NotificationServer::Observer::bannerDismissed, taken->first);
    if (const auto told = observer.lock())
      told->bannerActivated(taken->first, {.isActionButton = action == buttonAction,
                                           .activationToken = taken->second.activationToken});
  }

  void close(const BannerAddress& address, guint32 reason) {
    const auto taken = take(address);
    if (!taken) return;
    // The user may bring an expired banner back from the server's history.
    if (reason == expired) {
      Shown& kept = shown_.insert_or_assign(taken->first, taken->second).first->second;
      kept.isExpired = true;
    }
    using Observer = NotificationServer::Observer;
    tell(reason == dismissedByUser ? &Observer::bannerDismissed : &Observer::bannerGone,
         taken->first);
  }

  // What is on its way to the server that has ended is answered by the bus.
  void replaceServer(const std::string& before, bool isThere) {
    std::vector<std::string> gone;
    std::erase_if(shown_, [&](const auto& each) {
      const Shown& shown = each.second;
      if (!shown.address || shown.address->server != before) return false;
      if (!shown.isExpired) gone.push_back(each.first);
      return true;
    });
    for (const std::string& token : gone) tell(&NotificationServer::Observer::bannerGone, token);
    const auto told = observer.lock();
    if (told && isThere) told->serverAppeared();
  }

  SystemLog& systemLog_;
  const std::shared_ptr<SessionBus> bus_;
  const SessionBus::Subscription signals_;
  const SessionBus::Subscription servers_;
  std::map<std::string, Shown> shown_;  ///< By the owner's token.
  std::string lastError_;
  int pending_ = 0;  ///< Requests that have not been answered.
};

class BusNotificationServer final : public NotificationServer {
 public:
  BusNotificationServer(SystemLog& systemLog, const NotificationSource& source,
                        std::shared_ptr<SessionBus> bus)
      : desktop_(std::make_shared<Desktop>(systemLog, source, std::move(bus))) {}

  void setObserver(std::weak_ptr<Observer> observer) override {
    desktop_->observer = std::move(observer);
  }
  void setSource(const NotificationSource& source) override { desktop_->source = source; }
  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) override {
    desktop_->show(token, banner, replacedReference);
  }
  void close(const std::string& token, const std::optional<std::string>& reference) override {
    desktop_->close(token, reference);
  }
  void check(std::function<void(const std::optional<PlatformError>&)> answer) override {
    desktop_->check(std::move(answer));
  }
  bool isBusy() const override { return desktop_->isBusy(); }

 private:
  const std::shared_ptr<Desktop> desktop_;
};

}  // namespace

std::unique_ptr<NotificationServer> makeBusNotificationServer(SystemLog& systemLog,
                                                              const NotificationSource& source,
                                                              std::shared_ptr<SessionBus> bus) {
  return std::make_unique<BusNotificationServer>(systemLog, source, std::move(bus));
}

}  // namespace Varnel::Platform::Linux
