// SPDX-License-Identifier: MIT
// Desktop entries, and their command lines.
#include <stdlib.h>

#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/CommandLine.h>
#include <Varnel/Platform/Ports/Workspace.h>
#include <Varnel/Platform/Values/URL.h>

using namespace Varnel::Platform;

static void fuzz(std::string_view input) {
  static const auto folder = Varnel::Tests::TemporaryFolder::inMemory();
  // GLib looks once.
  [[maybe_unused]] static const int isSet = ::setenv("XDG_DATA_HOME", folder.path().c_str(), 1);
  folder.write("applications/org.example.App.desktop", input);
  if (const auto url = Linux::makeWorkspace()->applicationURL("org.example.App"))
    require(url->path().starts_with('/'));
  if (const auto program = Linux::programOf(std::string(input))) require(!program->empty());
}
