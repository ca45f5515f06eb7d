// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform {

/// Whether a file begins like one that holds sound, with or without a film.
[[nodiscard]] bool looksLikeSound(std::string_view bytes);

}  // namespace Varnel::Platform
