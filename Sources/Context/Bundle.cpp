// SPDX-License-Identifier: MIT
#include <Varnel/Context/Bundle.h>

#include <filesystem>
#include <map>
#include <mutex>
#include <utility>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/PropertyListParser.h>
#include <Varnel/Platform/Text/StringsTable.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using Platform::PropertyDictionary;
using Platform::StringsTable;

constexpr std::string_view developmentLanguage = "en";

// Empty, and so no property list, when the file cannot be read.
std::string bytesOf(const fs::path& file) {
  return Platform::readFile(file.string()).valueOr("");
}

std::optional<PropertyDictionary> readDictionary(const fs::path& file) {
  const auto list = Platform::parsePropertyList(bytesOf(file));
  const auto* dictionary = list ? list->as<PropertyDictionary>() : nullptr;
  if (!dictionary) return std::nullopt;
  return *dictionary;
}

// "zh-Hant-TW" is also served by "zh-Hant" and "zh".
std::vector<std::string> withParents(const std::string& language) {
  std::vector<std::string> chain = {language};
  for (std::size_t end = language.rfind('-'); end != std::string::npos && end > 0;
       end = language.rfind('-', end - 1))
    chain.push_back(language.substr(0, end));
  return chain;
}

}  // namespace

struct Bundle::Content {
  std::optional<fs::path> folder;
  std::vector<std::string> languages;

  std::once_flag infoRead;
  std::optional<PropertyDictionary> info;

  std::mutex mutex;  // Owns `tables`; a table, once there, never changes.
  std::map<std::string, std::vector<StringsTable>> tables;

  // The tables in the order in which they are asked: the first of the user's languages that the
  // bundle has, then English.
  std::vector<StringsTable> readTables(const std::string& name) const {
    std::vector<StringsTable> found;
    const auto read = [&](const std::string& language) {
      auto table = Platform::parseStringsTable(
          bytesOf(*folder / (language + ".lproj") / (name + ".strings")));
      if (table) found.push_back(std::move(*table));
      return !found.empty();
    };
    const auto readUserLanguage = [&] {
      for (const std::string& language : languages)
        for (const std::string& candidate : withParents(language))
          if (read(candidate)) return;
    };
    if (!folder) return found;
    readUserLanguage();
    read(std::string(developmentLanguage));
    return found;
  }

  const std::vector<StringsTable>& tablesNamed(const std::string& name) {
    const std::lock_guard lock(mutex);
    const auto known = tables.find(name);
    return known != tables.end() ? known->second : tables[name] = readTables(name);
  }
};

Bundle::Bundle(std::optional<std::string> folder, std::vector<std::string> languages)
    : content_(std::make_shared<Content>()) {
  if (folder) content_->folder = std::move(*folder);
  content_->languages = std::move(languages);
}

Bundle Bundle::main() {
  const Platform::Ports& ports = Platform::processPorts();
  return Bundle(ports.processInfo.get().mainBundleFolder(), ports.userLocale.get().languages());
}

std::optional<Platform::URL> Bundle::url() const {
  if (!content_->folder) return std::nullopt;
  return Platform::URL::fileURLWithPath(content_->folder->string() + "/");
}

const PropertyDictionary* Bundle::infoDictionary() const {
  Content& content = *content_;
  std::call_once(content.infoRead, [&] {
    if (content.folder) content.info = readDictionary(*content.folder / "Info.plist");
  });
  return content.info ? &*content.info : nullptr;
}

std::optional<std::string> Bundle::infoText(std::string_view key) const {
  const PropertyDictionary* info = infoDictionary();
  const auto* text = info ? Platform::findAs<std::string>(*info, key) : nullptr;
  if (!text) return std::nullopt;
  return *text;
}

std::optional<std::string> Bundle::identifier() const {
  return infoText("CFBundleIdentifier");
}

std::string Bundle::localizedString(std::string_view key, std::string_view defaultValue,
                                    const std::optional<std::string>& tableName) const {
  for (const StringsTable& table : content_->tablesNamed(tableName.value_or("Localizable")))
    if (const auto text = table.find(key); text != table.end()) return text->second;
  return std::string(defaultValue.empty() ? key : defaultValue);
}

std::optional<std::string> Bundle::resourcePath(std::string_view name) const {
  if (!content_->folder) return std::nullopt;
  const fs::path path = *content_->folder / name;
  std::error_code ignored;
  if (!fs::exists(path, ignored)) return std::nullopt;
  return path.string();
}

}  // namespace Varnel
