// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/KeyFileDefaults.h>

#include <glib.h>

#include <utility>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Text/UTF8.h>
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

bool canBeKey(const std::string& text) {
  return !text.empty() && text.find('\0') == std::string::npos;
}

// Another text would be cut, or be refused by the reader.
bool canBeKept(const UserDefaults::Value& value) {
  const auto* text = std::get_if<std::string>(&value);
  return !text || (text->find('\0') == std::string::npos && isValidUTF8(*text));
}

PlatformError invalidArgument() {
  return PlatformError(std::make_error_code(std::errc::invalid_argument));
}

struct Setter {
  GKeyFile* file;
  const char* key;

  void operator()(bool value) const { g_key_file_set_boolean(file, group, key, value); }
  void operator()(std::int64_t value) const { g_key_file_set_int64(file, group, key, value); }
  void operator()(double value) const { g_key_file_set_double(file, group, key, value); }
  void operator()(const std::string& value) const {
    g_key_file_set_string(file, group, key, value.c_str());
  }
};

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

std::optional<bool> KeyFileDefaults::truthValue(const std::string& key) const {
  return read<bool>(key, [](auto... arguments) { return g_key_file_get_boolean(arguments...); });
}
std::optional<std::int64_t> KeyFileDefaults::integer(const std::string& key) const {
  return read<std::int64_t>(key, g_key_file_get_int64);
}
std::optional<double> KeyFileDefaults::real(const std::string& key) const {
  return read<double>(key, g_key_file_get_double);
}
std::optional<std::string> KeyFileDefaults::text(const std::string& key) const {
  const auto value =
      read<Text>(key, [](auto... arguments) { return Text(g_key_file_get_string(arguments...)); });
  if (!value) return std::nullopt;
  return value->get();
}

std::optional<PlatformError> KeyFileDefaults::set(const std::string& key, const Value& value) {
  if (!canBeKey(key) || !canBeKept(value)) return invalidArgument();
  return change([&](GKeyFile* file) { std::visit(Setter{file, escaped(key).get()}, value); });
}

std::optional<PlatformError> KeyFileDefaults::remove(const std::string& key) {
  if (!canBeKey(key)) return invalidArgument();
  return change(
      [&](GKeyFile* file) { g_key_file_remove_key(file, group, escaped(key).get(), nullptr); });
}

template <typename Type, typename Get>
std::optional<Type> KeyFileDefaults::read(const std::string& key, Get get) const {
  const auto text = file_.text();
  if (!text) complain("cannot be read: " + text.error().localizedDescription());
  if (!text || !*text || !canBeKey(key)) return std::nullopt;
  const KeyFile file = parsed(**text);
  if (!file) complain("are damaged, and count as empty");
  if (!file) return std::nullopt;
  GError* error = nullptr;
  std::optional<Type> value(get(file.get(), group, escaped(key).get(), &error));
  if (!error) return value;
  g_error_free(error);
  return std::nullopt;
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

}  // namespace Varnel::Platform::Linux
