// SPDX-License-Identifier: MIT
// orvane: finds duplicate files, reading each disk with no more threads than it bears.
#include <exception>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane/CommandLine.h>
#include <orvane/Console.h>
#include <orvane/HelpText.h>
#include <orvane/LogOutput.h>
#include <orvane/OldLogs.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

int run(int count, const char* const* arguments, Console& console) {
  const auto parsed = parseCommandLine(count, arguments);
  if (const auto* information = std::get_if<Information>(&parsed))
    return console.writeResult(information->text) ? 0 : 1;
  if (const auto* error = std::get_if<UsageError>(&parsed)) {
    if (error->message.empty()) {
      console.print(usageText());
    } else {
      console.complain(error->message + " (see orvane --help)");
    }
    return 2;
  }
  const auto& invocation = std::get<Invocation>(parsed);
  sendLog(invocation.logOutput, console);
  removeOldLogs(Varnel::Platform::processPorts().clock.get().now());
  return invocation.command(console);
}

}  // namespace
}  // namespace Orvane

int main(int count, char** arguments) {
  using namespace Orvane;
  reserveStandardStreams();
  failOnClosedPipes();
  // The log writes to it until the process has ended.
  static Console& console = *new Console;
  try {
    const int status = run(count, arguments, console);
    return console.hasLostReader() ? endByClosedPipe() : status;
  } catch (const std::exception& exception) {
    console.complain(exception.what());
    return 1;
  }
}
