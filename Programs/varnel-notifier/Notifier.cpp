// SPDX-License-Identifier: MIT
#include <varnel-notifier/Notifier.h>

#include <fcntl.h>
#include <malloc.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Generic/NotificationDeliverer.h>
#include <Varnel/Platform/Generic/NotificationRows.h>
#include <Varnel/Platform/Linux/Notifications/BusHosts.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/ApplicationLauncher.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/SQLite/SQLiteFailure.h>

namespace Varnel {

using namespace Platform;
using namespace Platform::Linux;

namespace {

namespace fs = std::filesystem;

// The action of a desktop entry that an action button stands for: the notification's identifier,
// with a dash for each character that names of actions lack.
std::string actionOf(const NotificationActivation& activation) {
  if (!activation.isActionButton) return "";
  std::string name = activation.notification.identifier.value_or("");
  for (char& c : name)
    if (!g_ascii_isalnum(c)) c = '-';
  return name;
}

// Other programs have files of this name, too: what does not call itself a store is not touched,
// not even to find it damaged. Its application's name stands at a fixed place of any database.
bool isStore(const fs::path& file) {
  std::error_code error;
  if (!fs::is_regular_file(fs::symlink_status(file, error))) return false;
  constexpr off_t place = 68;
  std::array<std::uint8_t, 4> name{};
  const POSIX::FileDescriptor head(::open(file.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC));
  if (::pread(head.get(), name.data(), name.size(), place) != ssize_t{name.size()}) return false;
  std::uint32_t number = 0;
  for (const std::uint8_t byte : name) number = number << 8 | byte;
  return number == static_cast<std::uint32_t>(notificationFormat().applicationID);
}

}  // namespace

// A product's store and everything that serves it alone. Other processes change the store, also
// those that are killed before they can tell.
class Notifier::Product final {
 public:
  Product(Notifier& notifier, const fs::path& store)
      : ports_(notifier.ports_),
        launcher_(*notifier.launcher_),
        hosts_(notifier.bus_, [this](const auto& activation) { launch(activation); }),
        server_(makeBusNotificationServer(ports_.systemLog, {}, notifier.bus_)),
        timer_(notifier.sharedTimer_.share()),
        deliverer_({ports_.clock, ports_.userLocale, ports_.timeZones, ports_.mainQueue,
                    ports_.privateFiles, ports_.systemLog, *server_, *timer_},
                   store.string(), Migrating::never, hosts_),
        store_(store) {
    watchFolder();
    // The folder has the name of the base identifier, as far as names of files can.
    const auto source = deliverer_.source();
    hosts_.setProduct(source && *source ? (*source)->identifier
                                        : store.parent_path().filename().string());
    deliverer_.setDuty(NotificationDeliverer::Duty::everything);
  }

  NotificationDeliverer& deliverer() { return deliverer_; }
  // Its folder may be another one than before.
  void watchFolder() {
    watch_.emplace(store_.parent_path(), store_.filename(), [this] { deliverer_.recheck(); });
  }
  [[nodiscard]] bool isIdle() const { return deliverer_.isIdle() && isQuiet(); }
  [[nodiscard]] bool isQuiet() const {
    return deliverer_.isQuiet() && !hosts_.isBusy() && *launches_ == 0;
  }

 private:
  // The store first: the application looks there as soon as it runs.
  void launch(const NotificationActivation& activation) {
    const auto complain = [&log = ports_.systemLog](const std::optional<PlatformError>& error) {
      if (error)
        log.write("A clicked notification does not reach its application: " +
                  error->localizedDescription());
    };
    complain(keep(activation));
    const auto source = deliverer_.source();
    if (!source || !*source) return;
    ++*launches_;
    launcher_.launch({.desktopEntry = (*source)->desktopEntry,
                      .action = actionOf(activation),
                      .activationToken = activation.notification.activationToken.value_or("")},
                     [complain, launches = launches_](const auto& error) {
                       complain(error);
                       --*launches;
                     });
  }

  // Nobody clicks a second time, so others may take longer with the store than elsewhere.
  std::optional<PlatformError> keep(const NotificationActivation& activation) {
    constexpr int maxTries = 50;
    std::optional<PlatformError> error;
    for (int i = 0; i < maxTries; ++i) {
      error = deliverer_.keepLaunch(activation);
      if (!error || meaningOf(*error) != SQLiteFailure::busy) break;
    }
    return error;
  }

  const NotificationPorts ports_;
  ApplicationLauncher& launcher_;
  const std::shared_ptr<int> launches_ = std::make_shared<int>(0);  ///< Not answered yet.
  BusHosts hosts_;
  const std::unique_ptr<NotificationServer> server_;
  const std::unique_ptr<WallClockTimer> timer_;
  NotificationDeliverer deliverer_;
  const fs::path store_;
  std::optional<FileWatch> watch_;
};

Notifier::Notifier(const NotificationPorts& ports, const fs::path& executable)
    : ports_(ports),
      bus_(makeSessionBus()),
      launcher_(makeApplicationLauncher(bus_)),
      timer_(makeWallClockTimer(ports.systemLog)),
      sharedTimer_(ports.clock, *timer_),
      zoneWatch_("/etc", "localtime", [this] { recheck(); }),
      stateWatch_(POSIX::stateFolders(), [this](const auto& name) { lookAtFolder(name); }),
      program_(executable, ports.clock, sharedTimer_.share()) {
  bus_->serve({notifierPath, notifierInterface,
               [this](std::string_view, GVariant* arguments, GDBusMethodInvocation* call) {
                 receive(arguments, call);
               }});
  bus_->setObserver([this](bool isConnected) { isDisconnected_ = !isConnected; });
}

Notifier::~Notifier() = default;

// Who calls while the name is given back reaches this notifier still, or else the next one.
bool Notifier::run() {
  std::optional<std::string> failure;
  bus_->connect([&](const BusFailure* error) { failure = error ? error->text : ""; });
  sleepWhile([&] { return !failure; });
  if (!failure->empty()) {
    ports_.systemLog.write("Notifications are not delivered: " + *failure);
    return false;
  }
  do {
    if (!ownsName("RequestName")) return true;
    findProducts();
    sleepWhile([&] { return !isOver() && !isIdle(); });
    if (isDisconnected_) return true;
    static_cast<void>(ownsName("ReleaseName"));
  } while (!isIdle() && !(isOver() && handsOver()));
  return true;
}

bool Notifier::isOver() {
  return isDisconnected_ || program_.look() == ProgramFile::State::gone || isReplaced();
}

// A click on a banner that is up reaches its sender alone, so that is waited for.
bool Notifier::isReplaced() {
  return !isDisconnected_ && program_.look() == ProgramFile::State::replaced &&
         std::all_of(products_.begin(), products_.end(),
                     [](const auto& each) { return each.second->isQuiet(); });
}

// The bus starts what it finds by now: what lies in this program's place, or the program of another
// version in that one's. Where all of them are gone it starts nothing. Where the one in this place
// does not start, half written perhaps or with a library that has yet to come, this one goes on.
bool Notifier::handsOver() {
  if (isDisconnected_) return true;
  std::optional<bool> isStarted;
  bus_->ask(messageToBus("StartServiceByName", g_variant_new("(su)", notifierName, 0u)),
            SessionBus::usualTime,
            [&](GDBusMessage* reply, const auto&) { isStarted = reply != nullptr; });
  sleepWhile([&] { return !isStarted; });
  if (*isStarted || program_.look() == ProgramFile::State::gone) return true;
  program_.postpone();
  return false;
}

// Asks the bus for the name, or gives it back; whether this is its owner then.
bool Notifier::ownsName(const char* method) {
  constexpr guint32 doNotQueue = 4, owner = 1;
  const bool isRequest = std::string_view(method) == "RequestName";
  std::optional<guint32> answer;
  bus_->ask(messageToBus(method, isRequest ? g_variant_new("(su)", notifierName, doNotQueue)
                                           : g_variant_new("(s)", notifierName)),
            SessionBus::usualTime, [&](GDBusMessage* reply, const BusFailure&) {
              answer = reply ? bannerNumberIn(reply).value_or(0) : 0;
            });
  sleepWhile([&] { return !answer; });
  return isRequest && *answer == owner;
}

// What was used is given back before each sleep, which may last for weeks.
void Notifier::sleepWhile(const std::function<bool()>& condition) {
  while (condition()) {
    ::malloc_trim(0);
    ports_.mainQueue.runWhile([isFirst = true]() mutable { return std::exchange(isFirst, false); });
    while (condition() && ports_.mainQueue.drain()) continue;
  }
}

// Links to a folder lead to one store, which one product here is for.
Notifier::Product* Notifier::product(const fs::path& path) {
  std::error_code error;
  const fs::path store = fs::weakly_canonical(path.parent_path(), error) / path.filename();
  if (const auto known = products_.find(store); known != products_.end())
    return known->second.get();
  if (!isStore(store)) return nullptr;
  return (products_[store] = std::make_unique<Product>(*this, store)).get();
}

void Notifier::findProducts() {
  for (const fs::path& store : POSIX::notificationStores()) product(store);
}

// An application that is killed as soon as it has made its first plan tells nobody of it, and one
// whose folder was removed makes another.
void Notifier::lookAtFolder(const std::string& name) {
  const fs::path folder = POSIX::stateFolders() / name;
  const fs::path store = POSIX::notificationStoreIn(folder);
  // Other programs keep files here, or folders for a moment, and the user's watches are few.
  std::error_code error;
  std::erase_if(newFolders_, [&](const auto& each) {
    return each.first == folder || !fs::is_directory(each.first, error);
  });
  if (!fs::is_directory(folder, error)) return;
  newFolders_.try_emplace(folder, folder, store.filename(), [this, store] { product(store); });
  Product* const known = product(store);
  if (!known) return;
  newFolders_.erase(folder);
  known->watchFolder();
  known->deliverer().recheck();
}

void Notifier::recheck() {
  for (const auto& [store, product] : products_) product->deliverer().recheck();
}

bool Notifier::isIdle() const {
  return std::all_of(products_.begin(), products_.end(),
                     [](const auto& each) { return each.second->isIdle(); });
}

// The one method is `Changed`.
void Notifier::receive(GVariant* arguments, GDBusMethodInvocation* call) {
  Product* const concerned = product(storeIn(arguments));
  if (concerned) concerned->deliverer().recheck();
  const bool stays = concerned && !concerned->isIdle();
  g_dbus_method_invocation_return_value(call, g_variant_new("(b)", static_cast<gboolean>(stays)));
}

}  // namespace Varnel
