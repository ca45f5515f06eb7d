// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace Varnel::Platform::Linux {

/// Whether the bytes are those of a whole file of time zone data (RFC 8536), which refers to
/// nothing beyond its end. GLib believes what a file says of its own lengths.
[[nodiscard]] bool isWholeZoneFile(std::string_view bytes);

}  // namespace Varnel::Platform::Linux
