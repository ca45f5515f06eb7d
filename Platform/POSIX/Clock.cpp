// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/Clock.h>

#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::POSIX {
namespace {

class WallClock final : public Clock {
 public:
  Date now() const override {
    return std::chrono::floor<Date::duration>(std::chrono::system_clock::now());
  }
};

}  // namespace

std::unique_ptr<Clock> makeClock() {
  return std::make_unique<WallClock>();
}

}  // namespace Varnel::Platform::POSIX
