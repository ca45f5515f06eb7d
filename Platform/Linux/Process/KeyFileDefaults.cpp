// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/KeyFileDefaults.h>

#include <glib.h>

#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using KeyFile = UniqueHandle<GKeyFile*, g_key_file_unref>;
using Text = UniqueHandle<char*, g_free>;

constexpr const char* group = "Defaults";
constexpr auto keepsEverything =
    static_cast<GKeyFileFlags>(G_KEY_FILE_KEEP_COMMENTS | G_KEY_FILE_KEEP_TRANSLATIONS);

// A key of the file has no "=", no brackets and no blanks around it.
Text escaped(const std::string& key) {
  return Text(g_uri_escape_string(key.c_str(), nullptr, FALSE));
}

// None when the text is no key file.
KeyFile parsed(const std::string& text) {
  KeyFile file(g_key_file_new());
  if (!g_key_file_load_from_data(file.get(), text.data(), text.size(), keepsEverything, nullptr))
    file = KeyFile();
  return file;
}

}  // namespace

KeyFileDefaults::KeyFileDefaults(PrivateFiles& files, SystemLog& systemLog, std::string path)
    : systemLog_(systemLog), path_(path), file_(files, std::move(path)) {}

std::optional<std::string> KeyFileDefaults::readText(const std::string& key) const {
  const auto text = file_.text();
  if (!text) complain("cannot be read: " + text.error().localizedDescription());
  if (!text || !*text) return std::nullopt;
  const KeyFile file = parsed(**text);
  if (!file) complain("are damaged, and count as empty");
  if (!file) return std::nullopt;
  const Text value(g_key_file_get_string(file.get(), group, escaped(key).get(), nullptr));
  return value ? std::optional<std::string>(value.get()) : std::nullopt;
}

std::optional<PlatformError> KeyFileDefaults::writeText(const std::string& key,
                                                        const std::string& text) {
  return change([&](GKeyFile* file) {
    g_key_file_set_string(file, group, escaped(key).get(), text.c_str());
  });
}

std::optional<PlatformError> KeyFileDefaults::removeText(const std::string& key) {
  return change(
      [&](GKeyFile* file) { g_key_file_remove_key(file, group, escaped(key).get(), nullptr); });
}

std::optional<PlatformError> KeyFileDefaults::change(const std::function<void(GKeyFile*)>& edit) {
  const auto lock = file_.lock();
  if (!lock) return lock.error();
  const auto text = file_.text();
  if (!text) return text.error();
  KeyFile file = parsed(text->value_or(""));
  if (!file) {
    if (auto error = file_.setAside()) return error;
    complain("were damaged, and are now beside a new file, as .damaged");
    file = KeyFile(g_key_file_new());
  }
  edit(file.get());
  gsize size = 0;
  const Text edited(g_key_file_to_data(file.get(), &size, nullptr));
  return file_.replace({edited.get(), size});
}

void KeyFileDefaults::complain(const std::string& trouble) const {
  if (!hasComplained_.exchange(true)) systemLog_.write("The settings in " + path_ + " " + trouble);
}

std::unique_ptr<ApplicationStorage> makeApplicationStorage(PrivateFiles& files,
                                                           SystemLog& systemLog) {
  return POSIX::makeApplicationStorage("settings.ini", [&](const std::string& path) {
    return std::make_unique<KeyFileDefaults>(files, systemLog, path);
  });
}

}  // namespace Varnel::Platform::Linux
