// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Basalt {

/// The SHA-256 digest of the bytes: 32 bytes. Any thread.
[[nodiscard]] VARNEL_API std::string sha256(std::string_view bytes);

/// Two lower-case hexadecimal digits for each byte. Any thread.
[[nodiscard]] VARNEL_API std::string hexadecimal(std::string_view bytes);

}  // namespace Basalt
