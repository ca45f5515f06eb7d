// SPDX-License-Identifier: MIT
#include <Platform/Ports/Workspace.h>

#include <gio/gdesktopappinfo.h>

#include <filesystem>

#include <Platform/Generic/BundleFolders.h>
#include <Platform/Generic/UniqueHandle.h>
#include <Platform/Linux/Adapters.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using DesktopEntry = UniqueHandle<GDesktopAppInfo*, g_object_unref>;
using Text = UniqueHandle<char*, g_free>;

// A desktop entry's Exec line starts with a name to be searched on PATH, or with a path.
std::optional<fs::path> executableOf(const DesktopEntry& entry) {
  const char* program = g_app_info_get_executable(G_APP_INFO(entry.get()));
  if (!program) return std::nullopt;
  const Text found(g_find_program_in_path(program));
  if (!found) return std::nullopt;
  std::error_code failed;
  fs::path resolved = fs::canonical(found.get(), failed);
  return failed ? fs::path(found.get()) : resolved;
}

class DesktopEntries final : public Workspace {
 public:
  std::optional<URL> applicationURL(const std::string& bundleIdentifier) override {
    // An identifier is one file name; a separator would leave the folder of desktop entries.
    if (bundleIdentifier.empty() || bundleIdentifier.find('/') != std::string::npos)
      return std::nullopt;
    const DesktopEntry entry(g_desktop_app_info_new((bundleIdentifier + ".desktop").c_str()));
    if (!entry) return std::nullopt;
    const auto executable = executableOf(entry);
    if (!executable) return std::nullopt;
    if (const auto bundle = findBundleFolder(*executable, executable->filename().string()))
      return URL::fileURLWithPath(bundle->string() + "/");
    return URL::fileURLWithPath(executable->string());
  }
};

}  // namespace

std::unique_ptr<Workspace> makeWorkspace() {
  return std::make_unique<DesktopEntries>();
}

}  // namespace Varnel::Platform::Linux
