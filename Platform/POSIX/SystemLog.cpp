// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SystemLog.h>

#include <syslog.h>

#include <string>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/StandardOutput.h>

namespace Varnel::Platform::POSIX {
namespace {

// Where someone debugs, the lines show on standard error too.
#ifdef NDEBUG
constexpr bool alsoOnStandardError = false;
#else
constexpr bool alsoOnStandardError = true;
#endif

// The process has one connection to the log, and its name and options are the host's to choose.
class Syslog final : public SystemLog {
 public:
  void write(std::string_view line) override {
    ::syslog(LOG_USER | LOG_NOTICE, "%.*s", static_cast<int>(line.size()), line.data());
    if (alsoOnStandardError) makeStandardErrorOutput()->print(std::string(line) + "\n");
  }
};

}  // namespace

std::unique_ptr<SystemLog> makeSystemLog() {
  return std::make_unique<Syslog>();
}

}  // namespace Varnel::Platform::POSIX
