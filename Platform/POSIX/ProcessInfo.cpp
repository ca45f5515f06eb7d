// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ProcessInfo.h>

#include <sys/utsname.h>

#include <charconv>
#include <cstdlib>
#include <filesystem>
#include <utility>

#include <Varnel/Platform/Generic/BundleFolders.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/ImageFile.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

std::optional<std::string> asText(const std::optional<fs::path>& path) {
  if (!path) return std::nullopt;
  return path->string();
}

// "libvarnel.so.1.2" and an executable "orvane" go by "varnel" and "orvane".
std::string nameOfImage(const fs::path& image) {
  std::string name = image.filename().string();
  const std::size_t suffix = name.ends_with(".so") ? name.size() - 3 : name.find(".so.");
  if (suffix == std::string::npos) return name;
  name.resize(suffix);
  if (name.starts_with("lib")) name.erase(0, 3);
  return name;
}

// "6.1.0-18-amd64" is 6.1.0, "6.8" is 6.8.0.
OperatingSystemVersion versionFromRelease(std::string_view release) {
  OperatingSystemVersion version;
  const char* const end = release.data() + release.size();
  const char* position = release.data();
  for (long* number : {&version.major, &version.minor, &version.patch}) {
    const auto [rest, failed] = std::from_chars(position, end, *number);
    if (failed != std::errc() || rest == end || *rest != '.') break;
    position = rest + 1;
  }
  return version;
}

class UnameProcessInfo final : public ProcessInfo {
 public:
  explicit UnameProcessInfo(fs::path executable) : executable_(std::move(executable)) {}

  std::optional<std::string> environmentVariable(std::string_view name) const override {
    // The system would find the variable A where "A=B" is asked for.
    if (name.find('=') != std::string_view::npos || isCutShort(name)) return std::nullopt;
    const char* value = std::getenv(std::string(name).c_str());
    if (!value) return std::nullopt;
    return value;
  }

  OperatingSystemVersion operatingSystemVersion() const override {
    utsname names{};
    return ::uname(&names) == 0 ? versionFromRelease(names.release) : OperatingSystemVersion();
  }

  std::string executablePath() const override { return executable_.string(); }

  std::optional<std::string> mainBundleFolder() const override {
    return asText(findBundleFolder(executable_, executable_.filename().string()));
  }

  std::optional<std::string> bundleFolderOfCode(const void* address,
                                                std::string_view sharedFolder) const override {
    const fs::path image = imageFile(address);
    const fs::path& path = image.empty() ? executable_ : image;
    // The Info.plist beside a library may belong to the application that ships it.
    const auto shared = sharedFolder.empty() ? std::nullopt : findSharedFolder(path, sharedFolder);
    return asText(shared ? shared : findBundleFolder(path, nameOfImage(path)));
  }

 private:
  const fs::path executable_;
};

}  // namespace

std::unique_ptr<ProcessInfo> makeProcessInfo(const std::string& executable) {
  return std::make_unique<UnameProcessInfo>(executable);
}

}  // namespace Varnel::Platform::POSIX
