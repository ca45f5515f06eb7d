// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/NotificationServer.h>

#include <cstdint>
#include <map>
#include <string_view>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Values/NotificationSource.h>

namespace Varnel::Platform::Linux {
namespace {

// What the server's replies and signals refer to. Replies may outlive the adapter.
class Desktop final : public std::enable_shared_from_this<Desktop> {
 public:
  Desktop(SystemLog& systemLog, NotificationSource source, std::chrono::milliseconds patience)
      : systemLog_(systemLog),
        source_(std::move(source)),
        bus_(std::make_shared<SessionBus>([this](const char* sender, const char* name,
                                                 GVariant* body) { receive(sender, name, body); },
                                          patience)) {}

  std::weak_ptr<NotificationServer::Observer> observer;

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) {
    Shown& shown = shown_[token];
    if (!shown.address && replacedReference)
      shown.address = BannerAddress::parse(*replacedReference);
    shown.version = ++lastVersion_;
    bus_->connect([weak = weak_from_this(), key = Key{token, shown.version},
                   banner](const std::string& error) {
      const auto self = weak.lock();
      if (!self || !self->isCurrent(key)) return;
      if (!error.empty()) return self->fail(key, error);
      // Asked each time, because another server may have taken its place.
      self->send(capabilitiesRequest(), key,
                 [banner](Desktop& desktop, GDBusMessage* reply, const Key& asked) {
                   desktop.notify(asked, banner, g_dbus_message_get_sender(reply),
                                  capabilitiesIn(reply));
                 });
    });
  }

  void close(const std::string& token, const std::optional<std::string>& reference) {
    auto address = reference ? BannerAddress::parse(*reference) : std::nullopt;
    if (const auto shown = shown_.extract(token); shown && shown.mapped().address)
      address = shown.mapped().address;
    if (!address) return;
    bus_->connect([weak = weak_from_this(), address](const std::string& error) {
      const auto self = weak.lock();
      if (self && error.empty() && address->bus == self->bus_->name()) self->close(*address);
    });
  }

  bool isBusy() const { return bus_->isBusy(); }

 private:
  struct Shown {
    std::optional<BannerAddress> address;
    std::uint64_t version = 0;  ///< Tells the latest banner of a token from earlier ones.
  };
  struct Key {
    std::string token;
    std::uint64_t version;
  };

  bool isCurrent(const Key& key) const {
    const auto shown = shown_.find(key.token);
    return shown != shown_.end() && shown->second.version == key.version;
  }

  template <typename Use>
  void send(const BusMessage& message, const Key& key, Use use) {
    bus_->send(message,
               [weak = weak_from_this(), key, use](GDBusMessage* reply, const std::string& error) {
                 const auto self = weak.lock();
                 if (!self) return;
                 reply ? use(*self, reply, key) : self->fail(key, error);
               });
  }

  // It does not matter whether the banner was still there.
  void close(const BannerAddress& address) {
    bus_->send(closeRequest(address), [](GDBusMessage*, const std::string&) {});
  }

  void fail(const Key& key, const std::string& error) {
    systemLog_.write("Cannot show a notification: " + error);
    if (isCurrent(key)) shown_.erase(key.token);
  }

  void notify(const Key& key, const Banner& banner, const std::string& server,
              ServerCapabilities capabilities) {
    if (!isCurrent(key)) return;
    const auto& replaced = shown_[key.token].address;
    const bool knowsIt = replaced && replaced->bus == bus_->name() && replaced->server == server;
    send(notifyRequest(server, source_, banner, capabilities, knowsIt ? replaced->number : 0), key,
         [server](Desktop& self, GDBusMessage* reply, const Key& shown) {
           if (const auto number = bannerNumberIn(reply))
             self.hasShown(shown, {self.bus_->name(), server, *number});
         });
  }

  void hasShown(const Key& key, const BannerAddress& address) {
    const auto shown = shown_.find(key.token);
    // The banner was closed before the server had answered.
    if (shown == shown_.end()) return close(address);
    const auto earlier = std::exchange(shown->second.address, address);
    if (earlier && earlier->bus == address.bus && earlier->server == address.server &&
        earlier->number != address.number)
      close(*earlier);
    // The banner is being replaced by a newer one.
    if (!isCurrent(key)) return;
    if (const auto told = observer.lock()) told->bannerShown(key.token, address.reference());
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
      // The user may bring an expired banner back from the server's history.
      if (reason != expired) forget({bus_->name(), sender, number}, reason == dismissedByUser);
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
    close(address);
    const auto told = observer.lock();
    if (!told) return;
    if (action == dismissAction)
      told->bannerDismissed(*token);
    else
      told->bannerActivated(*token);
  }

  void forget(const BannerAddress& address, bool isDismissed) {
    const auto token = take(address);
    const auto told = observer.lock();
    if (token && told && isDismissed) told->bannerDismissed(*token);
  }

  SystemLog& systemLog_;
  const NotificationSource source_;
  const std::shared_ptr<SessionBus> bus_;
  std::map<std::string, Shown> shown_;
  std::uint64_t lastVersion_ = 0;
};

class BusNotificationServer final : public NotificationServer {
 public:
  BusNotificationServer(SystemLog& systemLog, const NotificationSource& source,
                        std::chrono::milliseconds patience)
      : desktop_(std::make_shared<Desktop>(systemLog, source, patience)) {}

  void setObserver(std::weak_ptr<Observer> observer) override {
    desktop_->observer = std::move(observer);
  }
  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) override {
    desktop_->show(token, banner, replacedReference);
  }
  void close(const std::string& token, const std::optional<std::string>& reference) override {
    desktop_->close(token, reference);
  }
  bool isBusy() const override { return desktop_->isBusy(); }

 private:
  const std::shared_ptr<Desktop> desktop_;
};

}  // namespace

std::unique_ptr<NotificationServer> makeNotificationServer(SystemLog& systemLog,
                                                           const NotificationSource& source,
                                                           std::chrono::milliseconds patience) {
  return std::make_unique<BusNotificationServer>(systemLog, source, patience);
}

}  // namespace Varnel::Platform::Linux
