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
  Desktop(SystemLog& systemLog, NotificationSource first, std::chrono::milliseconds patience)
      : source(std::move(first)),
        systemLog_(systemLog),
        bus_(std::make_shared<SessionBus>([this](const char* sender, const char* name,
                                                 GVariant* body) { receive(sender, name, body); },
                                          patience)) {}

  std::weak_ptr<NotificationServer::Observer> observer;
  NotificationSource source;

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) {
    const auto replaced =
        replacedReference ? BannerAddress::parse(*replacedReference) : std::nullopt;
    if (replaced) take(*replaced);
    shown_.insert_or_assign(token, Shown());
    bus_->connect([weak = weak_from_this(), token, banner, replaced](const std::string& error) {
      const auto self = weak.lock();
      if (!self || !self->shown_.contains(token)) return;
      if (!error.empty()) return self->fail(token, error);
      // Asked each time, because another server may have taken its place.
      self->send(capabilitiesRequest(), token, SessionBus::Waiting::limited,
                 [token, banner, replaced](Desktop& desktop, GDBusMessage* reply) {
                   desktop.notify(token, banner, replaced, g_dbus_message_get_sender(reply),
                                  capabilitiesIn(reply));
                 });
    });
  }

  void close(const std::string& token, const std::optional<std::string>& reference) {
    auto address = reference ? BannerAddress::parse(*reference) : std::nullopt;
    if (const auto shown = shown_.extract(token); shown && shown.mapped().address)
      address = *shown.mapped().address;
    bus_->connect([weak = weak_from_this(), token, address](const std::string& error) {
      const auto self = weak.lock();
      if (!self) return;
      if (!error.empty()) return self->tell(&NotificationServer::Observer::bannerFailed, token);
      // The server of another session has gone with its banners; then the bus alone is asked, so
      // that the answer comes later.
      const bool isHere = address && address->bus == self->bus_->name();
      self->bus_->send(isHere ? closeRequest(*address) : pingOfBus(), SessionBus::Waiting::limited,
                       [weak, token](GDBusMessage*, const std::string&) {
                         // Whatever the server says: it does not matter whether it was still there.
                         if (const auto asked = weak.lock())
                           asked->tell(&NotificationServer::Observer::bannerGone, token);
                       });
    });
  }

  void check(std::function<void(const std::optional<PlatformError>&)> answer) {
    const auto tell = [answer = std::move(answer)](const std::string& error) {
      if (error.empty()) return answer(std::nullopt);
      answer(
          PlatformError(notificationService, 0, {{std::string(localizedDescriptionKey), error}}));
    };
    bus_->connect([weak = weak_from_this(), tell](const std::string& error) {
      const auto self = weak.lock();
      if (!self) return;
      if (!error.empty()) return tell(error);
      self->bus_->send(capabilitiesRequest(), SessionBus::Waiting::limited,
                       [tell](GDBusMessage*, const std::string& refusal) { tell(refusal); });
    });
  }

  bool isBusy() const { return bus_->isBusy(); }

 private:
  using Event = void (NotificationServer::Observer::*)(const std::string& token);
  struct Shown {
    std::optional<BannerAddress> address;  // None while the server has yet to answer.
    bool isExpired = false;
  };

  void tell(Event event, const std::string& token) const {
    if (const auto told = observer.lock()) ((*told).*event)(token);
  }

  template <typename Use>
  void send(const BusMessage& message, const std::string& token, SessionBus::Waiting waiting,
            Use use) {
    bus_->send(
        message, waiting,
        [weak = weak_from_this(), token, use](GDBusMessage* reply, const std::string& error) {
          const auto self = weak.lock();
          if (!self) return;
          reply ? use(*self, reply) : self->fail(token, error);
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
    send(notifyRequest(server, source, banner, capabilities, knowsIt ? replaced->number : 0), token,
         SessionBus::Waiting::unlimited, [token, server](Desktop& self, GDBusMessage* reply) {
           const auto number = bannerNumberIn(reply);
           if (!number) return self.fail(token, "The notification server gives no number.");
           self.hasShown(token, {self.bus_->name(), server, *number});
         });
  }

  void hasShown(const std::string& token, const BannerAddress& address) {
    lastError_.clear();
    const auto shown = shown_.find(token);
    if (shown == shown_.end()) {
      // The banner was closed before the server had answered.
      bus_->send(closeRequest(address), SessionBus::Waiting::limited,
                 [](GDBusMessage*, const std::string&) {});
      return;
    }
    shown->second.address = address;
    if (const auto told = observer.lock()) told->bannerShown(token, address.reference());
  }

  void receive(const char* sender, std::string_view name, GVariant* body) {
    guint32 number = 0;
    if (name == "ActionInvoked" && g_variant_is_of_type(body, G_VARIANT_TYPE("(us)"))) {
      const char* action = nullptr;
      g_variant_get(body, "(u&s)", &number, &action);
      invoke({bus_->name(), sender, number}, action);
    }
    if (name == "NotificationClosed" && g_variant_is_of_type(body, G_VARIANT_TYPE("(uu)"))) {
      guint32 reason = 0;
      g_variant_get(body, "(uu)", &number, &reason);
      close({bus_->name(), sender, number}, reason);
    }
    if (name == "NameOwnerChanged" && g_variant_is_of_type(body, G_VARIANT_TYPE("(sss)"))) {
      const char* before = nullptr;
      const char* after = nullptr;
      g_variant_get(body, "(&s&s&s)", nullptr, &before, &after);
      replaceServer(before, *after != 0);
    }
  }

  // The banner's token, once: further signals for the same banner are ignored.
  std::optional<std::string> take(const BannerAddress& address) {
    for (auto shown = shown_.begin(); shown != shown_.end(); ++shown)
      if (shown->second.address == address) return shown_.extract(shown).key();
    return std::nullopt;
  }

  void invoke(const BannerAddress& address, std::string_view action) {
    const auto token = take(address);
    if (!token) return;
    // Not every server closes the banner by itself.
    bus_->send(closeRequest(address), SessionBus::Waiting::limited,
               [](GDBusMessage*, const std::string&) {});
    if (action == dismissAction)
      return tell(&NotificationServer::Observer::bannerDismissed, *token);
    if (const auto told = observer.lock())
      told->bannerActivated(*token, {.isActionButton = action == buttonAction});
  }

  void close(const BannerAddress& address, guint32 reason) {
    const auto token = take(address);
    if (!token) return;
    // The user may bring an expired banner back from the server's history.
    if (reason == expired) shown_[*token] = {.address = address, .isExpired = true};
    using Observer = NotificationServer::Observer;
    tell(reason == dismissedByUser ? &Observer::bannerDismissed : &Observer::bannerGone, *token);
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
  std::map<std::string, Shown> shown_;  // By token.
  std::string lastError_;
};

class BusNotificationServer final : public NotificationServer {
 public:
  BusNotificationServer(SystemLog& systemLog, const NotificationSource& source,
                        std::chrono::milliseconds patience)
      : desktop_(std::make_shared<Desktop>(systemLog, source, patience)) {}

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
                                                              std::chrono::milliseconds patience) {
  return std::make_unique<BusNotificationServer>(systemLog, source, patience);
}

}  // namespace Varnel::Platform::Linux
