// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Preferences.h>

#include <algorithm>
#include <utility>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Values/URL.h>

namespace Orvane {
namespace {

using Varnel::ApplicationData;
using Varnel::Platform::URL;

constexpr const char* soundsKey = "playsSounds";
constexpr const char* foldersKey = "lastFolders";
constexpr const char* hiddenKey = "skipsHidden";
constexpr const char* sizeKey = "minSize";

}  // namespace

bool Preferences::playsSounds() {
  return ApplicationData::settings().truthValue(soundsKey).value_or(false);
}

Preferences::Failure Preferences::setPlaysSounds(bool playsSounds) {
  return ApplicationData::settings().set(soundsKey, playsSounds);
}

ScanRequest Preferences::scanRequest() {
  const auto& settings = ApplicationData::settings();
  const std::int64_t minSize = settings.integer(sizeKey).value_or(0);
  return {.minSize = static_cast<std::uint64_t>(std::max<std::int64_t>(minSize, 0)),
          .skipsHidden = settings.truthValue(hiddenKey).value_or(true)};
}

Preferences::Failure Preferences::setSkipsHidden(bool skipsHidden) {
  return ApplicationData::settings().set(hiddenKey, skipsHidden);
}

Preferences::Failure Preferences::setMinSize(std::uint64_t bytes) {
  return ApplicationData::settings().set(sizeKey, static_cast<std::int64_t>(bytes));
}

// Paths are bytes and settings are text, so folders are kept as URLs.
std::vector<std::string> Preferences::lastFolders() {
  std::vector<std::string> folders;
  try {
    const auto text = ApplicationData::settings().text(foldersKey).value_or("[]");
    for (const std::string& each : Basalt::importStrings(Basalt::parseJSON(text), "lastFolders"))
      if (const auto url = URL::fileURLWithAbsoluteString(each)) folders.push_back(url->path());
  } catch (const Basalt::JSONError&) {
    folders.clear();
  }
  return folders;
}

Preferences::Failure Preferences::setLastFolders(const std::vector<std::string>& folders) {
  Varnel::Platform::PropertyList urls;
  for (const std::string& folder : folders)
    urls.emplace_back(URL::fileURLWithPath(folder).absoluteString());
  return ApplicationData::settings().set(foldersKey, Basalt::jsonText(std::move(urls)));
}

}  // namespace Orvane
