// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Platform/Api.h>

extern "C" {

// The facts that a build fixes, in a form that code in any language can call. Each flavour of the
// suite is compiled with its own constants; nothing reads them at run time.

VARNEL_API bool QNIsAppStoreVersion();
VARNEL_API bool QNIsSiteVersion();
VARNEL_API bool QNIsMarkettaVersion();
VARNEL_API bool QNIsPrivateBetaMode();
VARNEL_API bool QNIsDebugMode();
/// UTF-8, as the two below; lives as long as the library.
VARNEL_API const char* QNAppName();
VARNEL_API const char* QNAppDisplayVersion();
VARNEL_API const char* QNAppArrangeVersion();

}  // extern "C"

namespace Varnel {

/// The build switches as a value, so that the rules that follow from them can be tried with any
/// combination in one process.
///
///     BuildSwitches beta = BuildSwitches::ofThisBuild();
///     beta.isPrivateBetaMode = true;
struct VARNEL_API BuildSwitches {
  bool isAppStoreVersion = false;
  bool isSiteVersion = false;
  bool isMarkettaVersion = false;
  bool isPrivateBetaMode = false;
  bool isDebugMode = false;
  std::string appName = {};
  std::string appDisplayVersion = {};
  std::string appArrangeVersion = {};

  /// What the exported functions answer.
  [[nodiscard]] static BuildSwitches ofThisBuild();
};

}  // namespace Varnel
