// SPDX-License-Identifier: MIT
#include <Platform/Ports/VolumeCatalog.h>

#include <Platform/Linux/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {
class MountTableCatalog final : public VolumeCatalog {
 public:
  std::vector<MountedVolume> mountedVolumes() override { return {}; }
  Result<std::optional<URL>> volumeURL(const URL&) override { return std::optional<URL>(); }
  std::optional<std::string> volumeName(const URL&) override { return std::nullopt; }
  std::unique_ptr<Subscription> subscribe(ChangeHandler) override { return nullptr; }
};
}  // namespace

std::unique_ptr<VolumeCatalog> makeVolumeCatalog() {
  return std::make_unique<MountTableCatalog>();
}

}  // namespace Varnel::Platform::Linux
