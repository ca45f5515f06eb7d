// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

/// Facts about a volume that follow from the type of its file system.
namespace Varnel::Platform::Linux {

/// Whether the kernel shows itself in such a file system, rather than anybody's files.
[[nodiscard]] bool isPseudoFileSystem(std::string_view type);

/// Whether the files lie on another machine. Folders that the host of a virtual machine shares
/// through memory count as local.
[[nodiscard]] bool isNetworkFileSystem(std::string_view type);

}  // namespace Varnel::Platform::Linux
