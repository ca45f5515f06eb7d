// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <cstdlib>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/CommandLine.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using Text = std::optional<std::string>;

TEST(Workspace, FindsTheProgramOfACommandLine) {
  const std::pair<const char*, Text> cases[] = {
      {"app", "app"},
      {R"("/opt/My App/app" "a b" %f)", "/opt/My App/app"},
      {R"("/opt/\"a\`\$\\b/app")", R"(/opt/"a`$\b/app)"},
      {R"("/opt/100%% sure/app" %u)", "/opt/100% sure/app"},
      {"/opt/%%U/app", "/opt/%U/app"},
      {"%i app %c", "app"},
      {R"(/usr/bin/env A=1 "B=2 3" "/opt/My App/app" C=4)", "/opt/My App/app"},
      {"env -i - -0v -u HOME -uLANG -iu A -C /tmp --unset B --chdir=/ --unset=C app -u x", "app"},
      {"env --block-signal=INT --debug -a zero --argv0 one -- D=1 app", "app"},
      {R"(env -S "-u A B=1 'My App'" x)", "My App"},
      {R"(env --split-string="env -i A=%%" app)", "app"},
      {"env A=1 env B=2 app", "app"},
      {"env --uns LANG --split='-i app'", "app"},
      {"environment", "environment"},
      {"", {}},
      {"%U", {}},
      {R"("")", {}},
      {R"("" app)", {}},
      {R"("/opt/app)", {}},
      {"app %x", {}},
      {"app 100%", {}},
      {"env", {}},
      {"env -u", {}},
      {R"(env -S "'a")", {}},
  };
  for (const auto& [line, program] : cases) EXPECT_EQ(programOf(line), program) << line;
}

// The folders of desktop entries are read once a process.
TEST(Workspace, AnApplicationIsWhereItsDesktopEntryLeads) {
  const Tests::TemporaryFolder folder;
  const auto program = [&](const char* name) {
    const fs::path file = folder.write(name, "");
    fs::permissions(file, fs::perms::owner_all);
    return file.string();
  };
  const auto entry = [&](const std::string& name, const std::string& keys) {
    folder.write(name + ".desktop", "[Desktop Entry]\nType=Application\nName=Velt\n" + keys);
  };
  const std::string quoted = program("My \"$Apps/50% off/velt");
  const std::string onPath = program("bin/velt");
  const std::string bundled = program("Velt.app/velt");
  folder.write("Velt.app/Info.plist", "");
  fs::create_symlink(bundled, folder.path() / "bin/linked");
  ::setenv("XDG_DATA_HOME", (folder.path() / "user").c_str(), 1);
  ::setenv("XDG_DATA_DIRS", (folder.path() / "system").c_str(), 1);
  ::setenv("PATH", (folder.path() / "bin").c_str(), 1);

  const std::string apps = "system/applications/";
  const std::string root = folder.path().string();
  const struct {
    std::string identifier, keys;
    Text path;
  } rows[] = {
      // One backslash of a path takes four: the text's escape, and the quotation's.
      {"quoted", "Exec=\"" + root + R"(/My \\"\\$Apps/50%% off/velt" --open %U)" + "\n", quoted},
      {"env", "Exec=env LANG=C \"" + bundled + "\" %F\n", root + "/Velt.app"},
      {"linked", "Exec=linked\n", root + "/Velt.app"},
      {"name", "Exec=velt\nTryExec=" + onPath + "\n", onPath},
      {"com.quennel.Velt-dash", "", onPath},
      {"hidden", "Exec=velt\n", {}},
      {"untried", "Exec=velt\nTryExec=" + root + "/missing\n", {}},
      {"gone", "Exec=env LANG=C \"" + root + "/missing\"\n", {}},
      {"relative", "Exec=../bin/velt\n", {}},
      {"none", "DBusActivatable=true\n", {}},
      {"link", "", {}},
      {"broken", "", {}},
      {"../applications/name", "", {}},
  };
  for (const auto& row : rows)
    if (!row.keys.empty()) entry(apps + row.identifier, row.keys);
  entry(apps + "com.quennel.Velt/dash", "Exec=velt\n");
  entry("user/applications/hidden", "Exec=velt\nHidden=true\n");
  folder.write(apps + "link.desktop", "[Desktop Entry]\nType=Link\nExec=velt\n");
  folder.write(apps + "broken.desktop", "Exec=velt\n");

  const auto workspace = makeWorkspace();
  for (const auto& row : rows) {
    const auto url = workspace->applicationURL(row.identifier);
    EXPECT_EQ(url ? Text(url->path()) : std::nullopt, row.path) << row.identifier;
  }
}

}  // namespace
}  // namespace Varnel::Platform::Linux
