// SPDX-License-Identifier: MIT
#include <orvane/LogOutput.h>

#include <cassert>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

class ConsoleOutput final : public Varnel::Platform::StandardOutput {
 public:
  ConsoleOutput(Console& console, bool printsEventsOnly)
      : console_(console), printsEventsOnly_(printsEventsOnly) {}

  void print(std::string_view text) override {
    // A print is an entry, and the time is all that stands before its author.
    const bool isEvent = text.substr(0, text.find('\n')).find(eventMark) != std::string_view::npos;
    if (isEvent || !printsEventsOnly_) console_.print(text);
  }

 private:
  static constexpr std::string_view eventMark = "] CommonAnalyticsSender:  Category: ";

  Console& console_;
  const bool printsEventsOnly_;
};

}  // namespace

void sendLog(LogOutput output, Console& console) {
  if (output == LogOutput::standardOutput) return;  // The framework's own way.
  Varnel::Platform::Ports ports = Varnel::Platform::systemPorts();
  // Never destroyed: the process's ports are used until it has ended.
  ports.standardOutput = *new ConsoleOutput(console, output == LogOutput::none);
  [[maybe_unused]] const bool isInTime = installProcessPorts(ports);
  assert(isInTime);
}

}  // namespace Orvane
