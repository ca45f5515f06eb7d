// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/UserFeatures.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class Workspace;
}

namespace Varnel {

struct BuildSwitches;

/// A channel through which the application is distributed. Each channel's build has a bundle
/// identifier of its own, so that several may be installed on one machine.
///
///     if (!TargetKind::current().findOtherInstalledTargets().empty()) warnAboutSiblings();
///     switch (kind.case_()) { case TargetKind::Case::site: … }
///
/// A value. Any thread; finding installed applications may read files.
class VARNEL_API TargetKind final {
 public:
  enum class Case : int { appstore, marketta, site };

  static const TargetKind appstore;
  static const TargetKind marketta;
  static const TargetKind site;

  constexpr explicit TargetKind(Case kind) : kind_(kind) {}

  /// The case whose bundle identifier is exactly this text.
  [[nodiscard]] static std::optional<TargetKind> withBundleID(std::string_view bundleID);

  /// The three channels in the order of their raw values, which every search follows.
  [[nodiscard]] static const std::array<TargetKind, 3>& allValues();

  /// The product's channel. Stops the process when it names none.
  [[nodiscard]] static TargetKind current();
  /// The channel that these switches name. Stops the process when they name none.
  [[nodiscard]] static TargetKind of(const BuildSwitches& switches);

  [[nodiscard]] constexpr Case case_() const { return kind_; }
  [[nodiscard]] constexpr int rawValue() const { return static_cast<int>(kind_); }
  [[nodiscard]] const std::string& bundleID() const;
  /// Whether the build updates itself; a store updates its own.
  [[nodiscard]] bool hasUpdater() const;

  /// Where an application of this channel is installed; absent when none is. The workspace defaults
  /// to the process's own here and below.
  [[nodiscard]] std::optional<Platform::URL> urlOfInstance() const;
  [[nodiscard]] std::optional<Platform::URL> urlOfInstance(Platform::Workspace& workspace) const;
  [[nodiscard]] bool isInstalled() const;

  [[nodiscard]] static std::vector<TargetKind> findInstalledTargets();
  [[nodiscard]] static std::vector<TargetKind> findInstalledTargets(Platform::Workspace& workspace);

  /// The installed channels other than this one; a second copy of this one is not reported.
  [[nodiscard]] std::vector<TargetKind> findOtherInstalledTargets() const;
  [[nodiscard]] std::vector<TargetKind> findOtherInstalledTargets(
      Platform::Workspace& workspace) const;

  /// This channel's flag in a dictionary such as {"isAvailableInSite": true}; absent when it is
  /// missing or no truth value.
  [[nodiscard]] std::optional<bool> extractIsAvailable(const Basalt::JSON& dictionary) const;

  [[nodiscard]] UserFeatures defaultUserFeatures() const;

  /// The features to show when a server suggests some: the App Store build takes the suggestion as
  /// it is, the others add their defaults to it; without a suggestion, each build has its defaults.
  [[nodiscard]] UserFeatures userFeatures(std::optional<UserFeatures> withSuggestion) const;

  constexpr bool operator==(const TargetKind&) const = default;

 private:
  Case kind_;
};

inline constexpr TargetKind TargetKind::appstore{Case::appstore};
inline constexpr TargetKind TargetKind::marketta{Case::marketta};
inline constexpr TargetKind TargetKind::site{Case::site};

}  // namespace Varnel

template <>
struct std::hash<Varnel::TargetKind> {
  std::size_t operator()(Varnel::TargetKind kind) const noexcept {
    return std::hash<int>{}(kind.rawValue());
  }
};
