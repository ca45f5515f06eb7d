// SPDX-License-Identifier: MIT
#include <Varnel/Context/Globals.h>

#include <Varnel/Context/ProcessFacts.h>

namespace Varnel {

const ProcessFacts& Globals::facts() {
  static const ProcessFacts& ofThisProcess = *new ProcessFacts();
  return ofThisProcess;
}

const std::string& Globals::baseIdentifier() {
  return facts().baseIdentifier();
}
const std::string& Globals::applicationName() {
  return facts().applicationName();
}
const std::string& Globals::applicationNameHTML() {
  return facts().applicationNameHTML();
}
const std::string& Globals::applicationVersionString() {
  return facts().applicationVersionString();
}
const Basalt::Version& Globals::applicationVersion() {
  return facts().applicationVersion();
}
bool Globals::isDebugMode() {
  return facts().isDebugMode();
}
bool Globals::isPrivateBetaMode() {
  return facts().isPrivateBetaMode();
}
bool Globals::isAppStoreVersion() {
  return facts().isAppStoreVersion();
}
bool Globals::isSiteVersion() {
  return facts().isSiteVersion();
}
bool Globals::isMarkettaVersion() {
  return facts().isMarkettaVersion();
}
bool Globals::isSandboxed() {
  return facts().isSandboxed();
}
const std::optional<std::string>& Globals::containerPath() {
  return facts().containerPath();
}
bool Globals::canUseAllCores() {
  return facts().canUseAllCores();
}
bool Globals::isTimeHasCome() {
  return facts().isTimeHasCome();
}
bool Globals::isEndUserFeaturesEnabled() {
  return facts().isEndUserFeaturesEnabled();
}
const Platform::URL& Globals::fakeTrashURL() {
  return facts().fakeTrashURL();
}
std::string Globals::identifier(std::string_view suffix) {
  return facts().identifier(suffix);
}

std::string Globals::substitutingApplicationName(std::string_view text) {
  return facts().substitutingApplicationName(text);
}

std::string Globals::substitutingHtmlApplicationName(std::string_view text) {
  return facts().substitutingHtmlApplicationName(text);
}

bool Globals::extractIsAvailable(const Basalt::JSON& dictionary, bool defaultValue) {
  return facts().extractIsAvailable(dictionary, defaultValue);
}

std::vector<std::string> Globals::findOtherInstalledTargetBundleIDs() {
  return facts().findOtherInstalledTargetBundleIDs();
}

}  // namespace Varnel
