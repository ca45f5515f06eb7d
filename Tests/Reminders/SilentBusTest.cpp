// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <atomic>
#include <chrono>
#include <latch>
#include <optional>
#include <stop_token>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Linux/Notifications/NotificationMessages.h>
#include <Varnel/Platform/Linux/Notifications/NotifierConnection.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Values/NotificationSource.h>

namespace Varnel::Platform {
namespace {

constexpr std::chrono::seconds patience(10);

// Takes connections and never says a word.
class SilentBus final {
 public:
  SilentBus() {
    const std::string path = (folder_.path() / "bus").string();
    sockaddr_un address{.sun_family = AF_UNIX, .sun_path = {}};
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    EXPECT_EQ(::bind(socket_.get(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    EXPECT_EQ(::listen(socket_.get(), 8), 0);
    ::setenv("DBUS_SESSION_BUS_ADDRESS", ("unix:path=" + path).c_str(), 1);
  }

 private:
  const Tests::TemporaryFolder folder_;
  const POSIX::FileDescriptor socket_{::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)};
};

// Answers all that it is asked at once, or nothing any more, but never says who does.
class NamelessBus final {
 public:
  NamelessBus() {
    ::setenv("DBUS_SESSION_BUS_ADDRESS", address_.c_str(), 1);
    std::latch isReady(1);
    thread_ = std::jthread([this, &isReady](const std::stop_token& stop) {
      g_main_context_push_thread_default(context_.get());
      const Guid guid(g_dbus_generate_guid());
      const Server server(g_dbus_server_new_sync(address_.c_str(), G_DBUS_SERVER_FLAGS_NONE,
                                                 guid.get(), nullptr, nullptr, nullptr));
      g_signal_connect(server.get(), "new-connection", G_CALLBACK(&accept), this);
      g_dbus_server_start(server.get());
      isReady.count_down();
      const std::stop_callback wake(stop, [this] { g_main_context_wakeup(context_.get()); });
      while (!stop.stop_requested()) g_main_context_iteration(context_.get(), TRUE);
      if (connection_) g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr);
      g_main_context_pop_thread_default(context_.get());
    });
    isReady.wait();
  }

  std::atomic<bool> isMute = false;

 private:
  using Guid = UniqueHandle<char*, g_free>;
  using Server = UniqueHandle<GDBusServer*, g_object_unref>;
  using Context = UniqueHandle<GMainContext*, g_main_context_unref>;
  using Connection = UniqueHandle<GDBusConnection*, g_object_unref>;

  static gboolean accept(GDBusServer*, GDBusConnection* connection, gpointer bus) {
    g_dbus_connection_add_filter(connection, &answer, bus, nullptr);
    static_cast<NamelessBus*>(bus)->connection_ =
        Connection(G_DBUS_CONNECTION(g_object_ref(connection)));
    return TRUE;
  }
  static GDBusMessage* answer(GDBusConnection* connection, GDBusMessage* message, gboolean incoming,
                              gpointer bus) {
    if (!incoming) return message;
    const Linux::BusMessage call(message);
    if (static_cast<NamelessBus*>(bus)->isMute) return nullptr;
    const Linux::BusMessage reply(g_dbus_message_new_method_reply(call.get()));
    const char* const services[] = {"actions", nullptr};
    const bool asksForServices =
        std::string_view(g_dbus_message_get_member(call.get())) == "GetCapabilities";
    g_dbus_message_set_body(reply.get(), asksForServices ? g_variant_new("(^as)", services)
                                                         : g_variant_new("(s)", ":1.1"));
    g_dbus_connection_send_message(connection, reply.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr,
                                   nullptr);
    return nullptr;
  }

  const Tests::TemporaryFolder folder_;
  const std::string address_ = "unix:path=" + (folder_.path() / "bus").string();
  const Context context_{g_main_context_new()};
  Connection connection_;  // The thread's.
  std::jthread thread_;
};

// In a host that has made a context of its own the thread's.
TEST(NotificationServer, ABusThatDoesNotTellWhoAnswersCostsTheBannerAlone) {
  const NamelessBus bus;
  const auto mainQueue = Linux::makeMainQueue();
  Testing::CapturedSystemLog log;
  const auto server = Linux::makeBusNotificationServer(log, {}, Linux::makeSessionBus(patience));
  const UniqueHandle<GMainContext*, g_main_context_unref> own(g_main_context_new());
  g_main_context_push_thread_default(own.get());
  server->show("token", Banner(), {});
  EXPECT_TRUE(mainQueue->runWhile([&] { return server->isBusy(); }, std::chrono::seconds(10)));
  EXPECT_THAT(log.text(), testing::HasSubstr("does not tell who answers"));
  g_main_context_pop_thread_default(own.get());
}

TEST(NotificationServer, ABusThatIsLostKeepsNobodyWaitingAndTheNextTakesItsPlace) {
  std::optional<NamelessBus> bus(std::in_place);
  const auto mainQueue = Linux::makeMainQueue();
  Testing::CapturedSystemLog log;
  const auto server = Linux::makeBusNotificationServer(log, {}, Linux::makeSessionBus(patience));
  std::vector<bool> hasAnswered;
  const auto ask = [&] {
    server->check([&](const auto& obstacle) {
      hasAnswered.push_back(obstacle->localizedDescription().find("does not tell who") !=
                            std::string::npos);
    });
  };
  const auto await = [&] {
    return mainQueue->runWhile([&] { return server->isBusy(); }, std::chrono::seconds(10));
  };
  ask();
  EXPECT_TRUE(await());
  bus->isMute = true;
  ask();
  bus.emplace();
  EXPECT_TRUE(await());
  ask();
  EXPECT_TRUE(await());
  EXPECT_THAT(hasAnswered, testing::ElementsAre(true, false, true));
}

TEST(NotificationServer, AMainLoopThatComesLateFindsTheConnection) {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds halfSecond(500);
  const NamelessBus bus;
  const auto mainQueue = Linux::makeMainQueue();
  Testing::CapturedSystemLog log;
  const auto server = Linux::makeBusNotificationServer(log, {}, Linux::makeSessionBus(halfSecond));
  server->show("token", Banner(), {});
  const auto end = Clock::now() + halfSecond;
  while (!g_main_context_pending(nullptr)) std::this_thread::yield();
  if (Clock::now() >= end) GTEST_SKIP() << "The machine is too slow.";
  std::this_thread::sleep_until(end);
  mainQueue->runWhile([&] { return server->isBusy(); });
  EXPECT_THAT(log.text(), testing::HasSubstr("does not tell who answers"));
}

TEST(NotificationServer, ABusThatNeverAnswersCostsTheBannersAndNoWaiting) {
  const SilentBus bus;
  Banner banner;
  banner.title = "title";
  const auto mainQueue = Linux::makeMainQueue();
  Testing::CapturedSystemLog log;
  {
    const auto ended = Linux::makeBusNotificationServer(log, {}, Linux::makeSessionBus(patience));
    ended->show("token", banner, {});
    EXPECT_TRUE(ended->isBusy());
  }
  const auto server = Linux::makeBusNotificationServer(
      log, {}, Linux::makeSessionBus(std::chrono::milliseconds(50)));
  // Each attempt comes to an end, and the next banner makes another. The reason is said once.
  for (int attempt = 0; attempt < 2; ++attempt) {
    server->show("token", banner, {});
    server->close("other", "guid :1.1 7");
    EXPECT_TRUE(server->isBusy());
    EXPECT_TRUE(Tests::drainUntil(*mainQueue, [&] { return !server->isBusy(); }));
    EXPECT_EQ(log.text(), "Cannot show a notification: The session bus does not answer.\n");
  }
}

// Whose calls do nothing.
class Replacement final : public DelivererConnection {
 public:
  void setHost(std::weak_ptr<NotificationHost>, Standing) override {}
  void setActive(bool) override {}
  void changed() override {}
  void changedAtOnce() override {}
  void checkBanners(std::function<void(const Failure&)>) override {}
  [[nodiscard]] bool isBusy() const override { return false; }
};

TEST(NotifierConnection, ABusThatIsSilentIsAskedAgainAndOneThatHasGoneIsReplaced) {
  std::optional<SilentBus> bus(std::in_place);
  const auto mainQueue = Linux::makeMainQueue();
  int replacements = 0;
  Linux::NotifierConnection connection(Linux::makeSessionBus(std::chrono::milliseconds(50)),
                                       "com.example", "/store", [&] {
                                         ++replacements;
                                         return std::make_unique<Replacement>();
                                       });
  connection.changed();
  EXPECT_TRUE(Tests::drainUntil(*mainQueue, [&] { return !connection.isBusy(); }));
  EXPECT_EQ(replacements, 0);
  bus.reset();
  EXPECT_TRUE(Tests::drainUntil(*mainQueue, [&] { return replacements == 1; }));
}

// As the desktop notification standard orders the parts.
TEST(NotificationServer, ABannerCarriesWhoseItIs) {
  const struct {
    NotificationSource source;
    const char* start;
    const char* hints;
  } rows[] = {
      {{.name = "Fotovia \xff", .desktopEntry = "com.example.Fotovia", .icon = "/icons/a b.png"},
       "('Fotovia \uFFFD', uint32 7, 'file:///icons/a%20b.png', ",
       "{'desktop-entry': <'com.example.Fotovia'>, 'category': <'x-quennel.reminder'>, "
       "'urgency': <byte 0x01>}, -1)"},
      {{.name = "Fotovia", .icon = "fotovia"},
       "('Fotovia', uint32 7, 'fotovia', ",
       "[], {'category': <'x-quennel.reminder'>, 'urgency': <byte 0x01>}, -1)"},
      {{}, "('', uint32 7, '', ", "'urgency': <byte 0x01>}, -1)"},
  };
  for (const auto& row : rows) {
    const auto message = Linux::notifyRequest(":1.5", row.source, Banner(), {}, 7);
    const UniqueHandle<char*, g_free> printed(
        g_variant_print(g_dbus_message_get_body(message.get()), TRUE));
    EXPECT_THAT(printed.get(),
                testing::AllOf(testing::StartsWith(row.start), testing::EndsWith(row.hints)));
  }
}

}  // namespace
}  // namespace Varnel::Platform
