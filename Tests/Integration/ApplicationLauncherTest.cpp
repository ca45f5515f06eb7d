// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ApplicationLauncher.h>

#include <gio/gio.h>
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <chrono>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using ::testing::HasSubstr;

constexpr const char* applicationInterface = R"(<node>
  <interface name='org.freedesktop.Application'>
    <method name='Activate'><arg type='a{sv}' direction='in'/></method>
    <method name='ActivateAction'>
      <arg type='s' direction='in'/><arg type='av' direction='in'/>
      <arg type='a{sv}' direction='in'/>
    </method>
  </interface>
</node>)";

// A session bus of the test's own, without services, and a folder of desktop entries, which a
// process reads once.
class ApplicationLauncherTest : public testing::Test {
 protected:
  ApplicationLauncherTest() {
    g_test_dbus_up(bus_.get());
    ::setenv("XDG_DATA_HOME", folder_.path().c_str(), 1);
    ::setenv("DBUS_STARTER_ADDRESS", "nowhere", 1);
    const fs::path program =
        folder_.write("my \"$app", "#!/bin/sh\nexec >'" + output() +
                                       "'\nprintf '%s|' \"$@\" \"$PWD\" \"$DESKTOP_STARTUP_ID\" "
                                       "\"$XDG_ACTIVATION_TOKEN\" \"$DBUS_STARTER_ADDRESS\"\n");
    fs::permissions(program, fs::perms::owner_all);
    ::mkfifo(output().c_str(), 0600);
    launcher_ = makeApplicationLauncher(makeSessionBus());
  }
  ~ApplicationLauncherTest() override {
    launcher_.reset();
    g_test_dbus_stop(bus_.get());
  }

  // An entry that runs the program, quoted as the standard wants it, with these arguments.
  void install(const std::string& name, const std::string& arguments, const std::string& keys) {
    folder_.write("applications/" + name + ".desktop",
                  "[Desktop Entry]\nType=Application\nName=Velt\nIcon=velt\nExec=\"" +
                      folder_.path().string() + R"(/my \\"\\$app" )" + arguments + "\n" + keys);
  }

  // What went wrong, or an empty text.
  std::string launch(const ApplicationLaunch& launch) {
    std::optional<std::string> answer;
    launcher_->launch(
        launch, [&](const auto& error) { answer = error ? error->localizedDescription() : ""; });
    queue_->runWhile([&] { return !answer; }, 20s);
    return answer.value_or("no answer");
  }

  // What the program that was started tells, waited for.
  std::string told() const {
    std::stringstream text;
    text << std::ifstream(output()).rdbuf();
    return text.str();
  }

  std::string output() const { return (folder_.path() / "output").string(); }

  const UniqueHandle<GTestDBus*, g_object_unref> bus_{g_test_dbus_new(G_TEST_DBUS_NONE)};
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<MainQueue> queue_ = makeMainQueue();
  std::unique_ptr<ApplicationLauncher> launcher_;
};

TEST_F(ApplicationLauncherTest, ALineIsRunAsTheDesktopWould) {
  const std::string here = fs::current_path().string();
  install("plain", R"(%U one "two \\$ words" --part=100%% %c %i)", "");
  install("elsewhere", "", "Path=/\n");
  install("translated", "%c", "Name[de]=Welt\n");
  // One of these cannot be the name of a service.
  for (const char* name : {"unserved", ":1.5"}) install(name, "line", "DBusActivatable=true\n");
  const struct {
    ApplicationLaunch launch;
    std::string told;
  } rows[] = {
      {{.desktopEntry = "plain", .activationToken = "token"},
       "one|two $ words|--part=100%|Velt|--icon|velt|" + here + "|token|token||"},
      {{.desktopEntry = "elsewhere"}, "/||||"},
      {{.desktopEntry = "translated"}, "Velt|" + here + "||||"},
      {{.desktopEntry = "unserved"}, "line|" + here + "||||"},
      {{.desktopEntry = ":1.5"}, "line|" + here + "||||"},
  };
  for (const auto& row : rows) {
    ASSERT_EQ(launch(row.launch), "") << row.launch.desktopEntry;
    EXPECT_EQ(told(), row.told) << row.launch.desktopEntry;
  }
}

TEST_F(ApplicationLauncherTest, WhatIsNotInstalledIsNotStarted) {
  install("hidden", "", "Hidden=true\n");
  install("untried", "", "TryExec=/missing/program\n");
  folder_.write("applications/broken.desktop", "[Desktop Entry]\nType=Application\nName=Velt\n");
  folder_.write("applications/gone.desktop",
                "[Desktop Entry]\nType=Application\nName=Velt\nExec=/missing/program\n");
  for (const char* entry : {"hidden", "untried", "broken", "gone", "missing", "", "../plain"})
    EXPECT_NE(launch({.desktopEntry = entry}), "") << entry;
}

TEST_F(ApplicationLauncherTest, AnApplicationOnTheBusIsActivatedThere) {
  install("com.example.My-Velt", "",
          "DBusActivatable=true\nActions=scan;\n"
          "[Desktop Action scan]\nName=Scan\n");
  std::string heard;
  const auto application = makeSessionBus();
  application->serve({"/com/example/My_Velt", applicationInterface,
                      [&](std::string_view method, GVariant* body, GDBusMethodInvocation* call) {
                        const UniqueHandle<char*, g_free> text(g_variant_print(body, FALSE));
                        heard = std::string(method) + text.get();
                        if (heard.find("refuse") == std::string::npos)
                          return g_dbus_method_invocation_return_value(call, nullptr);
                        g_dbus_method_invocation_return_dbus_error(call, "com.example.No", "No!");
                      }});
  std::optional<bool> isOwner;
  application->ask(messageToBus("RequestName", g_variant_new("(su)", "com.example.My-Velt", 0u)),
                   SessionBus::usualTime,
                   [&](GDBusMessage* reply, const auto&) { isOwner = reply != nullptr; });
  ASSERT_TRUE(queue_->runWhile([&] { return !isOwner; }, 20s));
  const std::string token = "{'activation-token': <'t'>, 'desktop-startup-id': <'t'>}";
  const struct {
    ApplicationLaunch launch;
    std::string heard;
  } rows[] = {
      {{.activationToken = "t"}, "Activate(" + token + ",)"},
      {{.action = "scan", .activationToken = "t"}, "ActivateAction('scan', [], " + token + ")"},
      {{.action = "other"}, "Activate({},)"},
      {{.activationToken = "\xff"}, "Activate({},)"},
  };
  for (auto [asked, expected] : rows) {
    asked.desktopEntry = "com.example.My-Velt";
    EXPECT_EQ(launch(asked), "");
    EXPECT_EQ(heard, expected);
  }
  EXPECT_THAT(launch({.desktopEntry = "com.example.My-Velt", .activationToken = "refuse"}),
              HasSubstr("No!"));
}

}  // namespace
}  // namespace Varnel::Platform::Linux
