// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/BusHosts.h>

#include <Varnel/Platform/Linux/Notifications/HostName.h>
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>

namespace Varnel::Platform::Linux {
namespace {

// Longer than the deliverer waits.
constexpr std::chrono::seconds maxQuestion{5};

}  // namespace

BusHosts::BusHosts(std::shared_ptr<SessionBus> bus,
                   std::function<void(const NotificationActivation&)> launch)
    : bus_(std::move(bus)), launch_(std::move(launch)) {}

void BusHosts::setProduct(const std::string& baseIdentifier) {
  hostName_ = hostName(baseIdentifier);
  frontName_ = frontName(baseIdentifier);
}

BusMessage BusHosts::message(const char* method, GVariant* body) const {
  return messageToRunning(hostName_, hostPath, hostInterfaceName, method, body);
}

void BusHosts::shouldPresent(const UserNotification& notification,
                             std::function<void(bool isToShow)> answer) {
  bus_->ask(messageToBus("NameHasOwner", g_variant_new("(s)", frontName_.c_str())), maxQuestion,
            [life = std::weak_ptr(life_), notification, answer = std::move(answer)](
                GDBusMessage* reply, const BusFailure&) {
              const auto self = life.lock();
              if (!self || (reply && isYes(reply))) return answer(false);
              (*self)->askHost(notification, answer);
            });
}

void BusHosts::askHost(const UserNotification& notification,
                       const std::function<void(bool isToShow)>& answer) {
  bus_->ask(message("ShouldPresent", g_variant_new("(@a{sv})", variantOf(notification))),
            maxQuestion,
            [answer](GDBusMessage* reply, const BusFailure&) { answer(!reply || isYes(reply)); });
}

void BusHosts::didDeliver(const UserNotification& notification) {
  bus_->tell(message("DidDeliver", g_variant_new("(@a{sv})", variantOf(notification))));
}

// A host that hangs gets to the click when it goes on; the bus answers for one that ends before.
void BusHosts::didActivate(const NotificationActivation& activation) {
  ++pendingClicks_;
  bus_->ask(message("DidActivate", g_variant_new("(@a{sv}b)", variantOf(activation.notification),
                                                 static_cast<gboolean>(activation.isActionButton))),
            SessionBus::unlimitedTime,
            [life = std::weak_ptr(life_), activation](GDBusMessage* reply, const BusFailure&) {
              const auto self = life.lock();
              if (!self) return;
              --(*self)->pendingClicks_;
              if (!reply) (*self)->launch_(activation);
            });
}

}  // namespace Varnel::Platform::Linux
