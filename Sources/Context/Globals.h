// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Basalt/Version.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

class ProcessFacts;

/// What the process knows of itself: its name and version, the channel of its product,
/// whether a sandbox holds it. Stored facts are computed by their first reader and never change.
///
///     title = Globals::substitutingApplicationName(localized("About Orvane 2"));
///
/// Any thread. Nothing fails; only the first reading of `fakeTrashURL()` touches the file system
/// for more than the bundle's information dictionary.
class VARNEL_API Globals final {
 public:
  Globals() = delete;

  /// The suite-wide reverse-DNS base of the running application ("com.quennel.Orvane2"), or the
  /// executable's name where there is no bundle.
  [[nodiscard]] static const std::string& baseIdentifier();

  [[nodiscard]] static const std::string& applicationName();
  /// The name with "&nbsp;" for each space.
  [[nodiscard]] static const std::string& applicationNameHTML();
  /// "display (arrange)", as in "2.1 (2.1)".
  [[nodiscard]] static const std::string& applicationVersionString();
  /// The arrange version.
  [[nodiscard]] static const Basalt::Version& applicationVersion();

  [[nodiscard]] static bool isDebugMode();
  [[nodiscard]] static bool isPrivateBetaMode();
  [[nodiscard]] static bool isAppStoreVersion();
  [[nodiscard]] static bool isSiteVersion();
  [[nodiscard]] static bool isMarkettaVersion();

  /// Whether the environment names a sandbox container ("APP_SANDBOX_CONTAINER_ID", of any value).
  [[nodiscard]] static bool isSandboxed();
  /// The home folder of a sandboxed process; absent outside a sandbox.
  [[nodiscard]] static const std::optional<std::string>& containerPath();

  /// False in debug mode, which leaves the machine responsive for the debugger.
  [[nodiscard]] static bool canUseAllCores();
  /// Whether the product has been launched: strictly after 2016-05-09 00:00 UTC.
  [[nodiscard]] static bool isTimeHasCome();
  /// Computed anew each time. Debug mode shows everything, a private beta nothing; otherwise the
  /// launch date decides.
  [[nodiscard]] static bool isEndUserFeaturesEnabled();

  /// The folder that stands in for the trash, made on first use. It bears the temporary resource
  /// value `OVURLIsBookmarkedKey` (see ProcessFacts.h). A failure to make it is not reported.
  [[nodiscard]] static const Platform::URL& fakeTrashURL();

  /// `baseIdentifier()` and the suffix joined. An empty suffix is a programming error and stops the
  /// process.
  [[nodiscard]] static std::string identifier(std::string_view suffix);

  /// The text with the product's name in every place of the default one, "Orvane 2".
  [[nodiscard]] static std::string substitutingApplicationName(std::string_view text);
  /// The same for texts in HTML, where the default name is "Orvane&nbsp;2".
  [[nodiscard]] static std::string substitutingHtmlApplicationName(std::string_view text);

  /// The flag of the product's channel in a server's dictionary, or `defaultValue`.
  [[nodiscard]] static bool extractIsAvailable(const Basalt::JSON& dictionary, bool defaultValue);

  /// The bundle identifiers of the other channels' builds on this machine. Reads files.
  [[nodiscard]] static std::vector<std::string> findOtherInstalledTargetBundleIDs();

  /// The facts themselves, for code that is given its facts.
  [[nodiscard]] static const ProcessFacts& facts();
};

}  // namespace Varnel
