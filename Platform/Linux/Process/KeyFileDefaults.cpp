// SPDX-License-Identifier: MIT
#include <glib.h>

#include <filesystem>
#include <mutex>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Process/UserFolders.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using KeyFile = UniqueHandle<GKeyFile*, g_key_file_unref>;
using Text = UniqueHandle<char*, g_free>;

constexpr const char* group = "Defaults";

// A key of the file has no "=", no brackets and no blanks around it.
Text escaped(const std::string& key) {
  return Text(g_uri_escape_string(key.c_str(), nullptr, FALSE));
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

class KeyFileDefaults final : public UserDefaults {
 public:
  std::optional<bool> truthValue(const std::string& key) const override {
    return read<bool>(key, [](auto... arguments) { return g_key_file_get_boolean(arguments...); });
  }
  std::optional<std::int64_t> integer(const std::string& key) const override {
    return read<std::int64_t>(key, g_key_file_get_int64);
  }
  std::optional<double> real(const std::string& key) const override {
    return read<double>(key, g_key_file_get_double);
  }
  std::optional<std::string> text(const std::string& key) const override {
    const auto value = read<Text>(
        key, [](auto... arguments) { return Text(g_key_file_get_string(arguments...)); });
    if (!value) return std::nullopt;
    return value->get();
  }

  void set(const std::string& key, const Value& value) override {
    const std::lock_guard lock(mutex_);
    std::visit(Setter{loaded(), escaped(key).get()}, value);
    save();
  }

  void remove(const std::string& key) override {
    const std::lock_guard lock(mutex_);
    if (g_key_file_remove_key(loaded(), group, escaped(key).get(), nullptr)) save();
  }

 private:
  template <typename Type, typename Get>
  std::optional<Type> read(const std::string& key, Get get) const {
    const std::lock_guard lock(mutex_);
    GError* error = nullptr;
    std::optional<Type> value(get(loaded(), group, escaped(key).get(), &error));
    if (!error) return value;
    g_error_free(error);
    return std::nullopt;
  }

  // A file that is missing or damaged counts as empty.
  GKeyFile* loaded() const {
    if (!file_) {
      file_ = KeyFile(g_key_file_new());
      g_key_file_load_from_file(file_.get(), path_.c_str(), G_KEY_FILE_KEEP_COMMENTS, nullptr);
    }
    return file_.get();
  }

  void save() const {
    std::error_code ignored;
    fs::create_directories(path_.parent_path(), ignored);
    g_key_file_save_to_file(file_.get(), path_.c_str(), nullptr);
  }

  const fs::path path_ = userConfigurationFolder() / applicationFolderName() / "defaults.ini";
  mutable std::mutex mutex_;  ///< Owns `file_`.
  mutable KeyFile file_;
};

}  // namespace

std::unique_ptr<UserDefaults> makeUserDefaults() {
  return std::make_unique<KeyFileDefaults>();
}

}  // namespace Varnel::Platform::Linux
