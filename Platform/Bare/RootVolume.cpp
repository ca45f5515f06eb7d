// SPDX-License-Identifier: MIT
#include <sys/stat.h>

#include <cerrno>
#include <system_error>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Bare {
namespace {

// POSIX has no list of what is mounted where; of the root it says that there is one.
class RootVolume final : public VolumeCatalog {
 public:
  std::vector<MountedVolume> mountedVolumes() override { return {{.url = root_}}; }

  std::vector<URL> pseudoFileSystems() override { return {}; }

  Result<std::optional<URL>> volumeURL(const URL& url) override {
    if (isCutShort(url.path()))
      return PlatformError(std::make_error_code(std::errc::invalid_argument));
    struct stat status {};
    if (::lstat(url.path().c_str(), &status) != 0)
      return PlatformError(std::error_code(errno, std::generic_category()));
    return std::optional(root_);
  }

  std::optional<std::string> volumeName(const URL& volumeURL) override {
    if (volumeURL != root_) return std::nullopt;
    return volumeURL.lastPathComponent();
  }

  std::unique_ptr<Subscription> subscribe(ChangeHandler) override { return nullptr; }

 private:
  const URL root_ = URL::fileURLWithPath("/");
};

}  // namespace

std::unique_ptr<VolumeCatalog> makeVolumeCatalog() {
  return std::make_unique<RootVolume>();
}

}  // namespace Varnel::Platform::Bare
