// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/BusHosts.h>

#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>

namespace Varnel::Platform::Linux {
namespace {

// Longer than the deliverer waits.
constexpr std::chrono::seconds maxQuestion{5};

}  // namespace

BusHosts::BusHosts(std::shared_ptr<SessionBus> bus,
                   std::function<void(const NotificationActivation&)> launch)
    : bus_(std::move(bus)), launch_(std::move(launch)) {}

BusMessage BusHosts::message(const char* method, GVariant* body) const {
  return messageToRunning(name_, hostPath, hostInterfaceName, method, body);
}

void BusHosts::shouldPresent(const UserNotification& notification,
                             std::function<void(bool isToShow)> answer) {
  if (isInFront()) return answer(false);
  bus_->ask(message("ShouldPresent", g_variant_new("(@a{sv})", variantOf(notification))),
            maxQuestion, [answer = std::move(answer)](GDBusMessage* reply, const BusFailure&) {
              answer(!reply || isYes(reply));
            });
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

void BusHosts::setActive(const std::string& process, bool isActive) {
  if (!isActive) {
    active_.erase(process);
    return;
  }
  active_[process] = bus_->watch(process, [this, process](const auto&, const std::string& after) {
    if (after.empty()) active_.erase(process);
  });
  // It may have gone before anybody watched.
  bus_->ask(messageToBus("NameHasOwner", g_variant_new("(s)", process.c_str())),
            SessionBus::usualTime,
            [life = std::weak_ptr(life_), process](GDBusMessage* reply, const BusFailure&) {
              const auto self = life.lock();
              if (self && reply && !isYes(reply)) (*self)->active_.erase(process);
            });
}

}  // namespace Varnel::Platform::Linux
