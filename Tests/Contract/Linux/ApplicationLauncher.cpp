// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ApplicationLauncher.h>

#include <glib.h>
#include <stdlib.h>
#include <sys/stat.h>

#include <fstream>
#include <sstream>

#include <Tests/Contract/UserWorlds.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Notifications/SessionBus.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;

// Each application writes what it was started for into a pipe.
class DesktopWithoutBus final : public ApplicationLauncherWorld {
 public:
  DesktopWithoutBus() {
    ::setenv("XDG_DATA_HOME", folder_.path().c_str(), 1);
    ::setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere", 1);
    ::mkfifo(output().c_str(), 0600);
    launcher_ = Linux::makeApplicationLauncher(Linux::makeSessionBus());
  }
  [[nodiscard]] std::string obstacle() const override {
    return g_get_user_data_dir() == folder_.path() ? "" : "A process can do this once.";
  }
  ApplicationLauncher& port() override { return *launcher_; }
  void install(const std::string& desktopEntry, const std::string& action) override {
    const fs::path program = folder_.write(
        "app",
        "#!/bin/sh\nprintf '%s\\n' \"$1\" \"$2\" \"$XDG_ACTIVATION_TOKEN\" >'" + output() + "'\n");
    fs::permissions(program, fs::perms::owner_all);
    const std::string line = "Exec=" + program.string() + " " + desktopEntry;
    folder_.write("applications/" + desktopEntry + ".desktop",
                  "[Desktop Entry]\nType=Application\nName=App\n" + line + "\nActions=" + action +
                      ";\n[Desktop Action " + action + "]\nName=Act\n" + line + " " + action +
                      "\n");
  }
  // To the end: an application that still held the pipe would take the place of the next one.
  ApplicationLaunch started() override {
    std::stringstream told;
    told << std::ifstream(output()).rdbuf();
    ApplicationLaunch launch;
    for (std::string* line : {&launch.desktopEntry, &launch.action, &launch.activationToken})
      std::getline(told, *line);
    return launch;
  }

 private:
  std::string output() const { return (folder_.path() / "output").string(); }

  const Tests::TemporaryFolder folder_;
  std::unique_ptr<ApplicationLauncher> launcher_;
};
INSTANTIATE_TEST_SUITE_P(Linux, ApplicationLauncherContract, on<DesktopWithoutBus>());

}  // namespace
}  // namespace Varnel::Platform::Contract
