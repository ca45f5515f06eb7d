// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::GTK3 {

/// What a path leads to, as far as its text tells.
enum class PathKind { file, folder };

/// The short form of a path ("~/Documents/"). The file system is not asked, so that a disk that
/// hangs does not hold up the window. Always UTF-8. Any thread.
[[nodiscard]] VARNEL_API std::string pathText(const Platform::URL& url, PathKind kind);

/// A size in the user's formats ("1.5 MB"). Any thread.
[[nodiscard]] VARNEL_API std::string sizeText(std::int64_t bytes);

/// Any bytes as UTF-8 that GTK accepts: those that are none become "\xNN", and control characters
/// likewise, for names of files. Any thread.
[[nodiscard]] VARNEL_API std::string shownText(std::string_view bytes);

}  // namespace Varnel::GTK3
