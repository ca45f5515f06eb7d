// SPDX-License-Identifier: MIT
// orvane: finds duplicate files, reading each disk with no more threads than it bears.
// Exit status: 0 done, 1 failed, 2 wrong arguments, 128 and the number of the signal that ended it.
#include <exception>

#include <orvane/CommandLine.h>
#include <orvane/Console.h>
#include <orvane/LogOutput.h>
#include <orvane/StandardStreams.h>

int main(int count, char** arguments) {
  using namespace Orvane;
  reserveStandardStreams();
  failOnClosedPipes();
  // The log writes to it until the process has ended.
  static Console& console = *new Console;
  try {
    const auto parsed = parseCommandLine(count, arguments);
    if (const auto* information = std::get_if<Information>(&parsed))
      return console.writeResult(information->text) ? 0 : 1;
    if (const auto* error = std::get_if<UsageError>(&parsed)) {
      console.complain(error->message + " (see orvane --help)");
      return 2;
    }
    const auto& invocation = std::get<Invocation>(parsed);
    if (!invocation.logsToStandardOutput) sendLogTo(console);
    return invocation.command(console);
  } catch (const std::exception& exception) {
    console.complain(exception.what());
    return 1;
  }
}
