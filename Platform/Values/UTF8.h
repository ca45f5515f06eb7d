// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Whether the bytes are text in UTF-8, in its shortest form and without surrogates. Any thread.
[[nodiscard]] VARNEL_API bool isValidUTF8(std::string_view bytes);

}  // namespace Varnel::Platform
