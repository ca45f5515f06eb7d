// SPDX-License-Identifier: MIT
#pragma once

#include <curl/curl.h>

namespace Varnel::Platform {

/// Whether the host of a URL is the loopback interface, in whichever way it is written: a name
/// ("localhost" and all below it) or an address. No name is looked up.
[[nodiscard]] bool isOnThisMachine(CURLU* url);

}  // namespace Varnel::Platform
