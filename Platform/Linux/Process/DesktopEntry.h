// SPDX-License-Identifier: MIT
#pragma once

#include <glib.h>

#include <string>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {

using DesktopEntry = UniqueHandle<GKeyFile*, g_key_file_unref>;

/// The desktop entry of this identifier, which has no suffix: the user's before the system's, and
/// "a-b" also as "b" in a folder "a". None where it is missing, is no application's, or hides it.
/// Reads files.
[[nodiscard]] DesktopEntry findDesktopEntry(const std::string& identifier);

}  // namespace Varnel::Platform::Linux
