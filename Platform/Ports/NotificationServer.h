// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/NotificationSource.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

/// What a banner shows: plain UTF-8 texts. A button without a title is left out.
struct Banner final {
  std::string title = {};
  std::string text = {};
  std::string actionTitle = {};
  std::string dismissTitle = {};

  bool operator==(const Banner&) const = default;
};

/// How the user clicked a banner. A plain value.
struct BannerActivation final {
  bool isActionButton = false;       ///< Otherwise it was the banner itself.
  std::string activationToken = {};  ///< For a window that is to come to the front; may be empty.
};

/// The desktop's service that shows banners. A banner is known by the token that its owner gave it,
/// and by the server's reference, under which later runs of the application know it too.
///
/// Main thread only; no operation waits for the server. A server may be missing, come late or
/// restart: its owner hears of every request that came to nothing, and when to ask again.
class VARNEL_API NotificationServer {
 public:
  /// Hears what becomes of banners. Called on the main thread, and never from within an operation.
  class Observer {
   public:
    virtual ~Observer() = default;

    /// The banner is shown and has this reference.
    virtual void bannerShown(const std::string& token, const std::string& reference) = 0;
    /// What was asked for this banner, to show or to close it, could not be done.
    virtual void bannerFailed(const std::string& token) = 0;
    /// The user clicked the banner or its action button; the banner is gone. Called at most once
    /// for each banner.
    virtual void bannerActivated(const std::string& token, const BannerActivation& activation) = 0;
    /// The user closed the banner.
    virtual void bannerDismissed(const std::string& token) = 0;
    /// The banner is gone otherwise: it was closed as asked, has expired, or its server has ended.
    /// The user may yet bring an expired one back, and click it. Told once for each banner.
    virtual void bannerGone(const std::string& token) = 0;
    /// There is a server again, or another one. Told once something was asked of a server.
    virtual void serverAppeared() = 0;
  };

  virtual ~NotificationServer() = default;
  NotificationServer& operator=(const NotificationServer&) = delete;

  virtual void setObserver(std::weak_ptr<Observer> observer) = 0;

  /// The product that banners come from, from now on.
  virtual void setSource(const NotificationSource& source) = 0;

  /// Shows a banner, in the place of the one with this reference, whose token counts no more. A
  /// reference that the server does not know replaces nothing. Ends in `bannerShown` or
  /// `bannerFailed`, unless it is closed before; when the server ends before it has answered, in
  /// `bannerFailed`. No other banner that is shown has this token.
  virtual void show(const std::string& token, const Banner& banner,
                    const std::optional<std::string>& replacedReference) = 0;

  /// Removes the banner with this token or, if an earlier run showed it, with this reference. Ends
  /// in `bannerGone`, also when there was none or its server has ended, or in `bannerFailed` when
  /// that cannot be known.
  virtual void close(const std::string& token, const std::optional<std::string>& reference) = 0;

  /// Tells, later, why banners cannot be shown at present, or none; also without an observer.
  virtual void check(std::function<void(const std::optional<PlatformError>& obstacle)> answer) = 0;

  /// Whether any of these requests is still on its way to the server. Becomes false in the end,
  /// also without a server, but not while one has taken a banner and hangs.
  [[nodiscard]] virtual bool isBusy() const = 0;
};

}  // namespace Varnel::Platform
