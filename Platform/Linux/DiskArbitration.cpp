// SPDX-License-Identifier: MIT
#include <Platform/Ports/DiskArbitration.h>

#include <Platform/Linux/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {
class MountTableArbitration final : public DiskArbitration {
 public:
  std::unique_ptr<Session> openSession() override { return nullptr; }
};
}  // namespace

std::unique_ptr<DiskArbitration> makeDiskArbitration() {
  return std::make_unique<MountTableArbitration>();
}

}  // namespace Varnel::Platform::Linux
