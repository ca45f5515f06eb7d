// SPDX-License-Identifier: MIT
#include <Platform/Ports/SystemLog.h>

#include <syslog.h>

#include <string>

#include <Platform/POSIX/Adapters.h>

namespace Varnel::Platform::POSIX {
namespace {

// Where someone debugs, the lines show on standard error too.
#ifdef NDEBUG
constexpr int alsoOnStandardError = 0;
#else
constexpr int alsoOnStandardError = LOG_PERROR;
#endif

class Syslog final : public SystemLog {
 public:
  Syslog() { ::openlog(nullptr, LOG_PID | alsoOnStandardError, LOG_USER); }

  void write(std::string_view line) override {
    ::syslog(LOG_NOTICE, "%.*s", static_cast<int>(line.size()), line.data());
  }
};

}  // namespace

std::unique_ptr<SystemLog> makeSystemLog() {
  return std::make_unique<Syslog>();
}

}  // namespace Varnel::Platform::POSIX
