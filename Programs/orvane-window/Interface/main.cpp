// SPDX-License-Identifier: MIT
// orvane-window: the duplicate finder as a window.
#include <orvane-window/Interface/WindowApplication.h>
#include <orvane/Console.h>
#include <orvane/LogOutput.h>

int main(int count, char** arguments) {
  // The log writes to it until the process has ended.
  static Orvane::Console& console = *new Orvane::Console;
  Orvane::sendLog(Orvane::LogOutput::none, console);
  return Orvane::WindowApplication::create(console)->run(count, arguments);
}
