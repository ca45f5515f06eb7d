// SPDX-License-Identifier: MIT
#include <Varnel/Context/ProcessFacts.h>

#include <filesystem>
#include <utility>

#include <Varnel/Basalt/Assertions.h>
#include <Varnel/Basalt/Identifier.h>
#include <Varnel/Context/Bundle.h>
#include <Varnel/Context/TargetKind.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserAccount.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;

// Texts are written with these; a build with another name shows its own in their place.
constexpr std::string_view defaultName = "Orvane 2";
constexpr std::string_view defaultNameHTML = "Orvane&nbsp;2";

constexpr Platform::Date launchDate =
    std::chrono::sys_days(std::chrono::year(2016) / std::chrono::May / 9);

std::string replacingAll(std::string_view text, std::string_view what, std::string_view with) {
  std::string result;
  for (std::size_t found = 0; (found = text.find(what)) != std::string_view::npos;) {
    result += text.substr(0, found);
    result += with;
    text.remove_prefix(found + what.size());
  }
  return result += text;
}

// Every channel's build belongs to the one suite and shares its base. An application without a
// bundle uses the identifier that its product declares; without one, its executable's name.
std::string baseIdentifierOf(const Platform::ProcessInfo& processInfo,
                             const BuildSwitches& switches) {
  const Bundle bundle(processInfo.mainBundleFolder(), {});
  std::string identifier = bundle.identifier().value_or("");
  if (identifier.empty()) identifier = switches.bundleIdentifier;
  if (identifier.empty()) return fs::path(processInfo.executablePath()).filename().string();
  if (TargetKind::withBundleID(identifier)) return TargetKind::appstore.bundleID();
  return Basalt::withoutChannelComponent(identifier);
}

}  // namespace

ProcessFacts::ProcessFacts(Ports ports, BuildSwitches switches)
    : ports_(ports), switches_(std::move(switches)) {}

ProcessFacts::ProcessFacts(const Platform::Ports& ports, BuildSwitches switches)
    : ProcessFacts(Ports{ports.clock, ports.privateFiles, ports.processInfo, ports.userAccount,
                         ports.workspace},
                   std::move(switches)) {}

ProcessFacts::ProcessFacts(const Platform::Ports& ports)
    : ProcessFacts(ports, BuildSwitches::ofThisProduct()) {}

ProcessFacts::ProcessFacts() : ProcessFacts(Platform::processPorts()) {}

const std::string& ProcessFacts::baseIdentifier() const {
  return baseIdentifier_.get([&] { return baseIdentifierOf(ports_.processInfo, switches_); });
}

const std::string& ProcessFacts::applicationName() const {
  return switches_.appName;
}

const std::string& ProcessFacts::applicationNameHTML() const {
  return applicationNameHTML_.get([&] { return replacingAll(switches_.appName, " ", "&nbsp;"); });
}

const std::string& ProcessFacts::applicationVersionString() const {
  return applicationVersionString_.get(
      [&] { return switches_.appDisplayVersion + " (" + switches_.appArrangeVersion + ")"; });
}

const Basalt::Version& ProcessFacts::applicationVersion() const {
  return applicationVersion_.get([&] { return Basalt::Version(switches_.appArrangeVersion); });
}

bool ProcessFacts::isDebugMode() const {
  return switches_.isDebugMode;
}
bool ProcessFacts::isPrivateBetaMode() const {
  return switches_.isPrivateBetaMode;
}

bool ProcessFacts::isAppStoreVersion() const {
  return TargetKind::of(switches_) == TargetKind::appstore;
}
bool ProcessFacts::isSiteVersion() const {
  return TargetKind::of(switches_) == TargetKind::site;
}
bool ProcessFacts::isMarkettaVersion() const {
  return TargetKind::of(switches_) == TargetKind::marketta;
}

bool ProcessFacts::isSandboxed() const {
  return isSandboxed_.get([&] {
    return ports_.processInfo.environmentVariable("APP_SANDBOX_CONTAINER_ID").has_value();
  });
}

const std::optional<std::string>& ProcessFacts::containerPath() const {
  return containerPath_.get([&]() -> std::optional<std::string> {
    if (!isSandboxed()) return std::nullopt;
    return ports_.userAccount.homeFolder();
  });
}

bool ProcessFacts::canUseAllCores() const {
  return !isDebugMode();
}

bool ProcessFacts::isTimeHasCome() const {
  return isTimeHasCome_.get([&] { return ports_.clock.now() > launchDate; });
}

const Platform::URL& ProcessFacts::fakeTrashURL() const {
  return fakeTrashURL_.get([&] {
    const std::string path = ports_.userAccount.homeFolder() + "/Library/Application Support/" +
                             switches_.appName + "/FakeTrash";
    auto url = Platform::URL::fileURLWithPath(path);
    // The users of the folder will notice if it could not be made.
    static_cast<void>(ports_.privateFiles.makeFolders(path));
    url.setTemporaryResourceValue(OVURLIsBookmarkedKey, true);
    return url;
  });
}

bool ProcessFacts::isEndUserFeaturesEnabled() const {
  if (isDebugMode()) return true;
  if (isPrivateBetaMode()) return false;
  return isTimeHasCome();
}

std::string ProcessFacts::identifier(std::string_view suffix) const {
  std::string joined = Basalt::identifier(baseIdentifier(), suffix);
  if (joined.empty()) Basalt::assertUnreachable("Globals", __LINE__);
  return joined;
}

std::string ProcessFacts::substitutingApplicationName(std::string_view text) const {
  return replacingAll(text, defaultName, applicationName());
}

std::string ProcessFacts::substitutingHtmlApplicationName(std::string_view text) const {
  return replacingAll(text, defaultNameHTML, applicationNameHTML());
}

bool ProcessFacts::extractIsAvailable(const Basalt::JSON& dictionary, bool defaultValue) const {
  return TargetKind::of(switches_).extractIsAvailable(dictionary).value_or(defaultValue);
}

std::vector<std::string> ProcessFacts::findOtherInstalledTargetBundleIDs() const {
  std::vector<std::string> identifiers;
  for (const TargetKind kind :
       TargetKind::of(switches_).findOtherInstalledTargets(ports_.workspace))
    identifiers.push_back(kind.bundleID());
  return identifiers;
}

}  // namespace Varnel
