// SPDX-License-Identifier: MIT
#include <Varnel/Context/BuildSwitches.h>

#include "BuildConstants.h"

bool QNIsAppStoreVersion() {
  return Varnel::BuildConstants::channel == "appstore";
}
bool QNIsSiteVersion() {
  return Varnel::BuildConstants::channel == "site";
}
bool QNIsMarkettaVersion() {
  return Varnel::BuildConstants::channel == "marketta";
}
bool QNIsPrivateBetaMode() {
  return Varnel::BuildConstants::privateBeta;
}
bool QNIsDebugMode() {
  return Varnel::BuildConstants::debugMode;
}
const char* QNAppName() {
  return Varnel::BuildConstants::appName;
}
const char* QNAppDisplayVersion() {
  return Varnel::BuildConstants::appDisplayVersion;
}
const char* QNAppArrangeVersion() {
  return Varnel::BuildConstants::appArrangeVersion;
}

namespace Varnel {

BuildSwitches BuildSwitches::ofThisBuild() {
  return {
      .isAppStoreVersion = QNIsAppStoreVersion(),
      .isSiteVersion = QNIsSiteVersion(),
      .isMarkettaVersion = QNIsMarkettaVersion(),
      .isPrivateBetaMode = QNIsPrivateBetaMode(),
      .isDebugMode = QNIsDebugMode(),
      .appName = QNAppName(),
      .appDisplayVersion = QNAppDisplayVersion(),
      .appArrangeVersion = QNAppArrangeVersion(),
  };
}

}  // namespace Varnel
