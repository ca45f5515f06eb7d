// SPDX-License-Identifier: MIT
// The settings of an application, which people edit. What is set is there, and so is what was.
#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Process/KeyFileDefaults.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

using namespace Varnel::Platform;

static void fuzz(std::string_view input) {
  static const auto files = POSIX::makePrivateFiles();
  static const auto folder = Varnel::Tests::TemporaryFolder::inMemory();
  Testing::CapturedSystemLog log;
  Linux::KeyFileDefaults defaults(*files, log, folder.write("settings.ini", input).string());
  const auto before = defaults.text("old key");
  static_cast<void>(defaults.truthValue("truth"));
  static_cast<void>(defaults.integer("number"));
  static_cast<void>(defaults.real("number"));
  const std::string text = " a\\\n\t=[;#";
  require(!defaults.set("[new] = key", text));
  require(defaults.text("[new] = key") == text);
  require(defaults.text("old key") == before);
  require(!defaults.remove("[new] = key"));
  require(!defaults.text("[new] = key"));
}
