// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Basalt/Version.h>
#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Context/OnceValue.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class Clock;
class PrivateFiles;
class ProcessInfo;
class UserAccount;
class Workspace;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

/// The key under which `fakeTrashURL()` bears the temporary resource value `true`: the host's file
/// views show such a folder as one that the user has bookmarked.
inline constexpr std::string_view OVURLIsBookmarkedKey = "OVURLIsBookmarkedKey";

/// The facts behind `Globals`, for one set of build switches and one system. Hosts ask `Globals`;
/// their tests make facts of their own:
///
///     ProcessFacts facts(fakes.ports(), {.isSiteVersion = true, .appName = "Orvane 3"});
///     facts.substitutingApplicationName("Welcome to Orvane 2");  // "Welcome to Orvane 3"
///
/// Every fact but `isEndUserFeaturesEnabled()` is computed by its first reader and never changes.
/// Any thread.
class VARNEL_API ProcessFacts final {
 public:
  struct Ports {
    Platform::Clock& clock;
    Platform::PrivateFiles& privateFiles;
    Platform::ProcessInfo& processInfo;
    Platform::UserAccount& userAccount;
    Platform::Workspace& workspace;
  };

  ProcessFacts(Ports ports, BuildSwitches switches);
  ProcessFacts(const Platform::Ports& ports, BuildSwitches switches);
  explicit ProcessFacts(const Platform::Ports& ports);
  ProcessFacts();

  [[nodiscard]] const std::string& baseIdentifier() const;
  [[nodiscard]] const std::string& applicationName() const;
  [[nodiscard]] const std::string& applicationNameHTML() const;
  [[nodiscard]] const std::string& applicationVersionString() const;
  [[nodiscard]] const Basalt::Version& applicationVersion() const;
  [[nodiscard]] bool isDebugMode() const;
  [[nodiscard]] bool isPrivateBetaMode() const;
  [[nodiscard]] bool isAppStoreVersion() const;
  [[nodiscard]] bool isSiteVersion() const;
  [[nodiscard]] bool isMarkettaVersion() const;
  [[nodiscard]] bool isSandboxed() const;
  [[nodiscard]] const std::optional<std::string>& containerPath() const;
  [[nodiscard]] bool canUseAllCores() const;
  [[nodiscard]] bool isTimeHasCome() const;
  [[nodiscard]] const Platform::URL& fakeTrashURL() const;
  [[nodiscard]] bool isEndUserFeaturesEnabled() const;

  [[nodiscard]] std::string identifier(std::string_view suffix) const;
  [[nodiscard]] std::string substitutingApplicationName(std::string_view text) const;
  [[nodiscard]] std::string substitutingHtmlApplicationName(std::string_view text) const;
  [[nodiscard]] bool extractIsAvailable(const Basalt::JSON& dictionary, bool defaultValue) const;
  [[nodiscard]] std::vector<std::string> findOtherInstalledTargetBundleIDs() const;

 private:
  const Ports ports_;
  const BuildSwitches switches_;

  OnceValue<std::string> baseIdentifier_;
  OnceValue<std::string> applicationNameHTML_;
  OnceValue<std::string> applicationVersionString_;
  OnceValue<Basalt::Version> applicationVersion_;
  OnceValue<bool> isSandboxed_;
  OnceValue<std::optional<std::string>> containerPath_;
  OnceValue<bool> isTimeHasCome_;
  OnceValue<Platform::URL> fakeTrashURL_;
};

}  // namespace Varnel
