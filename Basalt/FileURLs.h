// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class UserAccount;
}

namespace Basalt {

/// The user's home folder as the system's records have it, even where a sandbox has moved "~"
/// elsewhere. Any thread.
[[nodiscard]] VARNEL_API Varnel::Platform::URL realHome(
    const Varnel::Platform::UserAccount& userAccount);

/// Whether a file URL names a folder: by its trailing slash or, without one, by a look into the
/// file system, which may block. False for what does not exist. Any thread.
[[nodiscard]] VARNEL_API bool isDirectory(const Varnel::Platform::URL& url);

}  // namespace Basalt
