// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/DiskAccess/DiskAccessGuard.h>

namespace Varnel {
class DiskAccessManager;
}

namespace Orvane {

/// A place on the disk of what has the path, or of the nearest folder above it that is there. Waits
/// for it; none where the framework gives no access.
[[nodiscard]] Varnel::DiskAccessGuard placeOnDiskOf(const std::string& path,
                                                    Varnel::DiskAccessManager& disks);

}  // namespace Orvane
