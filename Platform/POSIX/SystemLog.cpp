// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SystemLog.h>

#include <syslog.h>

#include <string>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Text/VisibleText.h>

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
    const std::string shown = visibleText(std::string(line), Backslashes::kept);
    ::syslog(LOG_USER | LOG_NOTICE, "%s", shown.c_str());
    if (alsoOnStandardError) makeStandardErrorOutput()->print(shown + "\n");
  }
};

}  // namespace

std::unique_ptr<SystemLog> makeSystemLog() {
  return std::make_unique<Syslog>();
}

}  // namespace Varnel::Platform::POSIX
