// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Notifications/NotifierConnection.h>

#include <utility>

#include <Varnel/Platform/Linux/Notifications/HostName.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Varnel::Platform::Linux {
namespace {

BusMessage changedMessage(const std::string& store) {
  BusMessage message(
      g_dbus_message_new_method_call(notifierName, notifierPath, notifierName, "Changed"));
  g_dbus_message_set_body(message.get(), g_variant_new("(^ay)", store.c_str()));
  return message;
}

}  // namespace

// What replies and calls refer to, which may come after the connection's end.
class NotifierConnection::Conversation final : public std::enable_shared_from_this<Conversation> {
 public:
  Conversation(std::shared_ptr<SessionBus> bus, const std::string& baseIdentifier,
               std::string store, MakeDeliverer makeDeliverer)
      : bus_(std::move(bus)),
        store_(std::move(store)),
        hostName_(hostName(baseIdentifier)),
        frontName_(frontName(baseIdentifier)),
        makeDeliverer_(std::move(makeDeliverer)),
        notifiers_(bus_->watch(notifierName, [this](const auto&, const std::string& owner) {
          if (owner.empty()) notifierEnded();
        })) {}

  void start() {
    const std::weak_ptr weak = weak_from_this();
    bus_->setObserver([weak](bool isConnected) {
      const auto self = weak.lock();
      if (!self) return;
      if (!isConnected) return self->tryLater();
      self->claimName();
      self->claimFront();
    });
    bus_->serve({hostPath, hostInterface,
                 [weak](std::string_view method, GVariant* arguments, GDBusMethodInvocation* call) {
                   const auto self = weak.lock();
                   const auto host = self ? self->host_.lock() : nullptr;
                   // Whoever calls goes on as if this process were not there.
                   if (!host)
                     return g_dbus_method_invocation_return_dbus_error(
                         call, "org.freedesktop.DBus.Error.Failed", "There is no host.");
                   g_dbus_method_invocation_return_value(call, receive(*host, method, arguments));
                 }});
  }

  void setHost(std::weak_ptr<NotificationHost> host, Standing standing) {
    host_ = std::move(host);
    standing_ = standing;
    if (replacement_) replacement_->setHost(host_, standing_);
    claimName();
    changed();
  }

  void setActive(bool isActive) {
    isActive_ = isActive;
    if (replacement_) return replacement_->setActive(isActive_);
    claimFront();
    // The notifier has to know before the next notification comes.
    if (isActive_) bus_->connect([](const BusFailure*) {});
  }

  // While one message is on its way, all further changes wait for one more.
  void changed() {
    if (replacement_) return replacement_->changed();
    if (std::exchange(isChanged_, true)) return;
    if (pendingChanges_ == 0) tellChanged();
  }

  void changedAtOnce() {
    if (replacement_) return replacement_->changedAtOnce();
    isUrgent_ = true;
    changed();
  }

  void checkBanners(std::function<void(const Failure& obstacle)> answer) {
    if (replacement_) return replacement_->checkBanners(std::move(answer));
    bus_->ask(capabilitiesRequest(), SessionBus::usualTime,
              [answer = std::move(answer)](GDBusMessage* reply, const BusFailure& failure) {
                if (reply) return answer(std::nullopt);
                answer(PlatformError(notificationService, 0,
                                     {{std::string(localizedDescriptionKey), failure.text}}));
              });
  }

  bool isBusy() const { return pendingChanges_ > 0 || (replacement_ && replacement_->isBusy()); }

 private:
  static constexpr int maxStarts = 3;

  static GVariant* receive(NotificationHost& host, std::string_view method, GVariant* arguments) {
    const NotificationActivation call = activationIn(arguments);
    if (method == "ShouldPresent")
      return g_variant_new("(b)", static_cast<gboolean>(host.shouldPresent(call.notification)));
    if (method == "DidDeliver") host.didDeliver(call.notification);
    if (method == "DidActivate") host.didActivate(call);
    return nullptr;
  }

  void tellChanged() {
    isChanged_ = false;
    ++pendingChanges_;
    bus_->ask(changedMessage(store_), SessionBus::usualTime,
              [weak = weak_from_this()](GDBusMessage* reply, const BusFailure& failure) {
                if (const auto self = weak.lock()) self->changeAnswered(reply, failure);
              });
  }

  void changeAnswered(GDBusMessage* reply, const BusFailure& failure) {
    --pendingChanges_;
    if (!reply) return isHopeless(failure) ? replace() : tryLater();
    isUrgent_ = false;
    staysForUs_ = isYes(reply);
    failedStarts_ = 0;
    pause_.succeeded();
    retry_ = AttachedSource();
    if (isChanged_) tellChanged();
  }

  // Somebody that the bus cannot start may have been killed on the way.
  bool isHopeless(const BusFailure& failure) {
    failedStarts_ = failure.isNobodyThere() ? failedStarts_ + 1 : 0;
    return failure.isUnknownThere() || failedStarts_ == maxStarts;
  }

  void tryLater() {
    if (replacement_) return;
    pause_.failed(Date());
    const auto pause = std::chrono::ceil<std::chrono::milliseconds>(pause_.end() - Date());
    isChanged_ = false;
    retry_ = AttachedSource(attach(g_timeout_source_new(static_cast<guint>(pause.count())),
                                   G_PRIORITY_DEFAULT, [this] { changed(); }));
  }

  // A notifier that had nothing to do any more is not called back. One that ended otherwise is,
  // once.
  void notifierEnded() {
    if (std::exchange(staysForUs_, false) && !replacement_) changed();
  }

  void replace() {
    if (replacement_) return;
    replacement_ = makeDeliverer_();
    replacement_->setActive(isActive_);
    replacement_->setHost(host_, standing_);
    if (isUrgent_)
      replacement_->changedAtOnce();
    else
      replacement_->changed();
  }

  // Several processes may be in front; one has the name, and the others wait for it.
  void claimFront() const {
    bus_->tell(isActive_
                   ? messageToBus("RequestName", g_variant_new("(su)", frontName_.c_str(), 0u))
                   : messageToBus("ReleaseName", g_variant_new("(s)", frontName_.c_str())));
  }

  // Waits in the bus's queue while somebody has the name who does not give way.
  void claimName() const {
    constexpr std::uint32_t givesWay = 1, takesOver = 2;
    bus_->tell(
        host_.expired()
            ? messageToBus("ReleaseName", g_variant_new("(s)", hostName_.c_str()))
            : messageToBus("RequestName",
                           g_variant_new("(su)", hostName_.c_str(),
                                         standing_ == Standing::onlooker ? givesWay : takesOver)));
  }

  const std::shared_ptr<SessionBus> bus_;
  const std::string store_;
  const std::string hostName_;
  const std::string frontName_;
  const MakeDeliverer makeDeliverer_;
  std::unique_ptr<DelivererConnection> replacement_;  ///< Where there is no notifier.
  std::weak_ptr<NotificationHost> host_;
  Standing standing_ = Standing::application;
  bool isActive_ = false;
  bool isChanged_ = false;   ///< Since the last message.
  bool isUrgent_ = false;    ///< Something must not wait for a host.
  bool staysForUs_ = false;  ///< What the notifier said last.
  int pendingChanges_ = 0;   ///< Messages that have not been answered.
  int failedStarts_ = 0;     ///< In a row.
  GrowingPause pause_{std::chrono::seconds(1), std::chrono::minutes(5)};
  AttachedSource retry_;
  const SessionBus::Subscription notifiers_;
};

NotifierConnection::NotifierConnection(std::shared_ptr<SessionBus> bus,
                                       const std::string& baseIdentifier, std::string store,
                                       MakeDeliverer makeDeliverer)
    : conversation_(std::make_shared<Conversation>(std::move(bus), baseIdentifier, std::move(store),
                                                   std::move(makeDeliverer))) {
  conversation_->start();
}

NotifierConnection::~NotifierConnection() = default;

void NotifierConnection::setHost(std::weak_ptr<NotificationHost> host, Standing standing) {
  conversation_->setHost(std::move(host), standing);
}

void NotifierConnection::setActive(bool isActive) {
  conversation_->setActive(isActive);
}

void NotifierConnection::changed() {
  conversation_->changed();
}

void NotifierConnection::changedAtOnce() {
  conversation_->changedAtOnce();
}

void NotifierConnection::checkBanners(std::function<void(const Failure& obstacle)> answer) {
  conversation_->checkBanners(std::move(answer));
}

bool NotifierConnection::isBusy() const {
  return conversation_->isBusy();
}

}  // namespace Varnel::Platform::Linux
