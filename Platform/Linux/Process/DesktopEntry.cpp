// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/DesktopEntry.h>

#include <string_view>

namespace Varnel::Platform::Linux {
namespace {

using Text = UniqueHandle<char*, g_free>;

constexpr const char* group = G_KEY_FILE_DESKTOP_GROUP;

}  // namespace

DesktopEntry findDesktopEntry(const std::string& identifier) {
  // An identifier must be one file name. With a separator, it could lead out of the folder of
  // desktop entries.
  if (identifier.empty() || identifier.find('/') != std::string::npos) return {};
  DesktopEntry entry(g_key_file_new());
  const std::string file = "applications/" + identifier + ".desktop";
  if (!g_key_file_load_from_data_dirs(entry.get(), file.c_str(), nullptr,
                                      G_KEY_FILE_KEEP_TRANSLATIONS, nullptr))
    return {};
  const Text type(g_key_file_get_string(entry.get(), group, G_KEY_FILE_DESKTOP_KEY_TYPE, nullptr));
  if (!type || std::string_view(type.get()) != G_KEY_FILE_DESKTOP_TYPE_APPLICATION) return {};
  if (g_key_file_get_boolean(entry.get(), group, G_KEY_FILE_DESKTOP_KEY_HIDDEN, nullptr)) return {};
  return entry;
}

}  // namespace Varnel::Platform::Linux
