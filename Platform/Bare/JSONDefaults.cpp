// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Bare/JSONDefaults.h>

#include <utility>

#include <nlohmann/json.hpp>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Bare {
namespace {

using nlohmann::json;

// What people may have written beside the texts reads as the text that they see.
std::string textOf(const json& value) {
  return value.is_string() ? value.get<std::string>() : value.dump();
}

// Absent when the bytes are no object.
std::optional<std::map<std::string, std::string>> parsed(const std::string& bytes) {
  std::map<std::string, std::string> texts;
  if (bytes.empty()) return texts;
  const json object = json::parse(bytes, nullptr, false);
  if (!object.is_object()) return std::nullopt;
  for (const auto& [key, value] : object.items()) texts.emplace(key, textOf(value));
  return texts;
}

}  // namespace

JSONDefaults::JSONDefaults(PrivateFiles& files, SystemLog& systemLog, std::string path)
    : systemLog_(systemLog), path_(path), file_(files, std::move(path)) {}

std::optional<std::string> JSONDefaults::readText(const std::string& key) const {
  const auto bytes = file_.text();
  if (!bytes) complain("cannot be read: " + bytes.error().localizedDescription());
  if (!bytes || !*bytes) return std::nullopt;
  const auto texts = parsed(**bytes);
  if (!texts) complain("are damaged, and count as empty");
  if (!texts || !texts->contains(key)) return std::nullopt;
  return texts->at(key);
}

std::optional<PlatformError> JSONDefaults::writeText(const std::string& key,
                                                     const std::string& text) {
  return change([&](Texts& texts) { texts[key] = text; });
}

std::optional<PlatformError> JSONDefaults::removeText(const std::string& key) {
  return change([&](Texts& texts) { texts.erase(key); });
}

std::optional<PlatformError> JSONDefaults::change(const std::function<void(Texts&)>& edit) {
  const auto lock = file_.lock();
  if (!lock) return lock.error();
  const auto bytes = file_.text();
  if (!bytes) return bytes.error();
  auto texts = parsed(bytes->value_or(""));
  if (!texts) {
    if (auto error = file_.setAside()) return error;
    complain("were damaged, and are now beside a new file, as .damaged");
    texts.emplace();
  }
  edit(*texts);
  return file_.replace(json(*texts).dump(2) + "\n");
}

void JSONDefaults::complain(const std::string& trouble) const {
  if (!hasComplained_.exchange(true)) systemLog_.write("The settings in " + path_ + " " + trouble);
}

std::unique_ptr<ApplicationStorage> makeApplicationStorage(PrivateFiles& files,
                                                           SystemLog& systemLog) {
  return POSIX::makeApplicationStorage("settings.json", [&](const std::string& path) {
    return std::make_unique<JSONDefaults>(files, systemLog, path);
  });
}

}  // namespace Varnel::Platform::Bare
