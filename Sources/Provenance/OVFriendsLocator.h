// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <mutex>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {
class Workspace;
}

namespace Varnel {

/// Tells which of the maker's other products are installed.
///
///     if (!OVFriendsLocator::isVeltInstalled()) offerVelt();
///
/// Nothing is remembered: each question asks the workspace again. "MAS" means the store's edition,
/// "Site" that of the web site. Any thread; questions may read files.
class VARNEL_API OVFriendsLocator final {
 public:
  OVFriendsLocator(const OVFriendsLocator&) = delete;
  OVFriendsLocator& operator=(const OVFriendsLocator&) = delete;

  /// The one locator of the process.
  [[nodiscard]] static OVFriendsLocator& sharedLocator();

  /// The workspace that the shared locator asks: the process's own until another is set. Setting
  /// none restores it.
  [[nodiscard]] static std::shared_ptr<Platform::Workspace> workspace();
  void setWorkspace(std::shared_ptr<Platform::Workspace> workspace);

  [[nodiscard]] static bool isKelvaneClassicInstalled();
  [[nodiscard]] static bool isKelvane2Installed();
  [[nodiscard]] static bool isKelvane3Installed();
  [[nodiscard]] static bool isOrvane1MASInstalled();
  [[nodiscard]] static bool isOrvane1SiteInstalled();
  [[nodiscard]] static bool isOrvane2Installed();
  [[nodiscard]] static bool isVeltMASInstalled();
  /// The trial edition counts.
  [[nodiscard]] static bool isVeltSiteInstalled();
  [[nodiscard]] static bool isDrumlinInstalled();
  [[nodiscard]] static bool isBrambleInstalled();

  /// Counts any generation or edition.
  [[nodiscard]] static bool isKelvaneInstalled();
  [[nodiscard]] static bool isOrvane1Installed();
  [[nodiscard]] static bool isVeltInstalled();

 private:
  OVFriendsLocator() = default;

  std::mutex mutex_;  ///< Owns `workspace_`.
  std::shared_ptr<Platform::Workspace> workspace_;
};

}  // namespace Varnel
