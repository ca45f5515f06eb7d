// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {
class HTTPClient;
}

/// The entry of the module: the process's only client over libcurl, or null when the library cannot
/// be set up. It lives as long as the process.
extern "C" __attribute__((visibility("default"))) Varnel::Platform::HTTPClient* varnelHTTPClient();
