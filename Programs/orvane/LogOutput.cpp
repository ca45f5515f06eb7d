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
  explicit ConsoleOutput(Console& console) : console_(console) {}

  void print(std::string_view text) override { console_.print(text); }

 private:
  Console& console_;
};

}  // namespace

void sendLogTo(Console& console) {
  Varnel::Platform::Ports ports = Varnel::Platform::systemPorts();
  // Never destroyed: the process's ports are used until it has ended.
  ports.standardOutput = *new ConsoleOutput(console);
  [[maybe_unused]] const bool isInTime = installProcessPorts(ports);
  assert(isInTime);
}

}  // namespace Orvane
