// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/Workspace.h>

#include <glib.h>

#include <filesystem>

#include <Varnel/Platform/Generic/BundleFolders.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/CommandLine.h>
#include <Varnel/Platform/Linux/Process/DesktopEntry.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using Text = UniqueHandle<char*, g_free>;

std::optional<std::string> textIn(const DesktopEntry& entry, const char* key) {
  const Text text(g_key_file_get_string(entry.get(), G_KEY_FILE_DESKTOP_GROUP, key, nullptr));
  if (!text) return std::nullopt;
  return std::string(text.get());
}

// A program is the name of one on PATH, or its whole path.
std::optional<fs::path> find(const std::string& program) {
  const bool isRelative = program.find('/') != std::string::npos && !program.starts_with('/');
  if (program.empty() || isRelative) return std::nullopt;
  const Text found(g_find_program_in_path(program.c_str()));
  if (!found) return std::nullopt;
  std::error_code failed;
  fs::path resolved = fs::canonical(found.get(), failed);
  return failed ? fs::path(found.get()) : resolved;
}

// Absent where the entry's "TryExec" program is missing.
std::optional<fs::path> executableOf(const DesktopEntry& entry) {
  const auto tried = textIn(entry, G_KEY_FILE_DESKTOP_KEY_TRY_EXEC);
  if (tried && !find(*tried)) return std::nullopt;
  const auto line = textIn(entry, G_KEY_FILE_DESKTOP_KEY_EXEC);
  const auto program = line ? programOf(*line) : std::nullopt;
  return program ? find(*program) : std::nullopt;
}

class DesktopEntries final : public Workspace {
 public:
  std::optional<URL> applicationURL(const std::string& bundleIdentifier) override {
    const DesktopEntry entry = findDesktopEntry(bundleIdentifier);
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
