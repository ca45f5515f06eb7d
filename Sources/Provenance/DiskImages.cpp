// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/DiskImages.h>

#include <chrono>
#include <string_view>
#include <thread>

#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Text/PropertyListParser.h>

namespace Varnel {
namespace {

using Platform::PropertyDictionary;
using Platform::PropertyList;
using Platform::PropertyValue;

constexpr std::chrono::duration<float> pollInterval{0.01F};

const PropertyList& listIn(const PropertyDictionary* dictionary, std::string_view key) {
  static const PropertyList empty;
  const auto* list = dictionary ? Platform::findAs<PropertyList>(*dictionary, key) : nullptr;
  return list ? *list : empty;
}

const std::string* textIn(const PropertyDictionary* dictionary, std::string_view key) {
  return dictionary ? Platform::findAs<std::string>(*dictionary, key) : nullptr;
}

bool isMountedAt(const PropertyValue& entity, const std::string& volumePath) {
  const std::string* mountPoint = textIn(entity.as<PropertyDictionary>(), "mount-point");
  return mountPoint && *mountPoint == volumePath;
}

// False when the tool had to be ended.
bool waitForEnd(Platform::LaunchedProcess& process, std::optional<Platform::TimeInterval> timeout) {
  using Clock = std::chrono::steady_clock;
  const auto start = Clock::now();
  while (process.isRunning()) {
    if (timeout && std::chrono::duration<double>(Clock::now() - start).count() >= *timeout) {
      process.terminate();
      return false;
    }
    std::this_thread::sleep_for(pollInterval);
  }
  return true;
}

}  // namespace

std::optional<PropertyValue> mountedDrivesInfo(Platform::ProcessLauncher& launcher,
                                               const std::string& toolPath,
                                               std::optional<Platform::TimeInterval> timeout) {
  const auto launched = launcher.launch(toolPath, {"info", "-plist"});
  if (!launched) return std::nullopt;
  Platform::LaunchedProcess& tool = **launched;
  // Only a tool that has ended has printed everything. It may fail after its answer, which counts
  // all the same.
  if (!waitForEnd(tool, timeout)) return std::nullopt;
  return Platform::parsePropertyList(tool.readOutput());
}

std::optional<std::string> findImagePath(const std::string& volumePath,
                                         const PropertyValue& volumesInfo) {
  for (const PropertyValue& image : listIn(volumesInfo.as<PropertyDictionary>(), "images")) {
    const auto* facts = image.as<PropertyDictionary>();
    for (const PropertyValue& entity : listIn(facts, "system-entities")) {
      if (!isMountedAt(entity, volumePath)) continue;
      const std::string* path = textIn(facts, "image-path");
      if (!path) return std::nullopt;
      return *path;
    }
  }
  return std::nullopt;
}

}  // namespace Varnel
