// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

extern "C" {

// The running product's declaration of itself, as functions that code in any language can call. The
// library belongs to no product: see Product.h.

VARNEL_API bool QNIsAppStoreVersion();
VARNEL_API bool QNIsSiteVersion();
VARNEL_API bool QNIsMarkettaVersion();
VARNEL_API bool QNIsPrivateBetaMode();
VARNEL_API bool QNIsDebugMode();
/// UTF-8, as are the two below; lives as long as the process.
VARNEL_API const char* QNAppName();
VARNEL_API const char* QNAppDisplayVersion();
VARNEL_API const char* QNAppArrangeVersion();

}  // extern "C"

namespace Varnel {

/// The build switches of a product as a value, so that the rules that follow from them can be tried
/// with any combination in one process.
///
///     BuildSwitches beta = BuildSwitches::ofThisProduct();
///     beta.isPrivateBetaMode = true;
struct VARNEL_API BuildSwitches final {
  bool isAppStoreVersion = false;
  bool isSiteVersion = false;
  bool isMarkettaVersion = false;
  bool isPrivateBetaMode = false;
  bool isDebugMode = false;
  /// The name in texts, as in "Orvane 2".
  std::string appName = {};
  /// The version as shown to the user, and as compared with others.
  std::string appDisplayVersion = {};
  std::string appArrangeVersion = {};
  /// The bundle identifier, for a program that has no information dictionary of its own.
  std::string bundleIdentifier = {};
  /// Host of the service that links go through; a plain host name.
  std::string redirectHost = {};
  /// The domain of the vendor's web-analytics cookie, with its leading dot.
  std::string cookieDomain = {};
  /// The desktop entry without its suffix, and an icon's name or path: the desktop shows banners
  /// under these.
  std::string desktopEntry = {};
  std::string icon = {};

  bool operator==(const BuildSwitches&) const = default;

  /// The switches behind the exported functions: those that the product declared or, in a program
  /// that declares no product, the executable's name and the site channel. Any thread; never
  /// changes.
  [[nodiscard]] static const BuildSwitches& ofThisProduct();
};

}  // namespace Varnel
