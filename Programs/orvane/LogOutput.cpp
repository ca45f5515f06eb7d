// SPDX-License-Identifier: MIT
#include <orvane/LogOutput.h>

#include <cassert>

#include <Platform/Ports/Ports.h>
#include <Platform/Ports/StandardOutput.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

class ConsoleOutput final : public Varnel::Platform::StandardOutput {
 public:
  explicit ConsoleOutput(Console& console) : console_(console) {}

  void print(std::string_view text) override { console_.print(text); }

 private:
  Console& console_;
};

}  // namespace

void sendLogTo(Console& console) {
  // Process ports are used until the process has ended.
  static ConsoleOutput& output = *new ConsoleOutput(console);
  const Varnel::Platform::Ports& system = Varnel::Platform::systemPorts();
  [[maybe_unused]] const bool isInTime = Varnel::Platform::installProcessPorts({
      .appendFiles = system.appendFiles,
      .clock = system.clock,
      .deviceRegistry = system.deviceRegistry,
      .diskArbitration = system.diskArbitration,
      .processInfo = system.processInfo,
      .securityScope = system.securityScope,
      .standardOutput = output,
      .systemLog = system.systemLog,
      .userAccount = system.userAccount,
      .userLocale = system.userLocale,
      .volumeCatalog = system.volumeCatalog,
      .workspace = system.workspace,
  });
  assert(isInTime);
}

}  // namespace Orvane
