// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include <Scan/FileSystem.h>

namespace Orvane {

/// Opens the folder of a file, as the next.
[[nodiscard]] FileResult<std::unique_ptr<OpenFolder>> openFolderOf(const std::string& path,
                                                                   FileSystem& fileSystem);

/// Opens a file for reading by its absolute path. No part of that may be a link.
[[nodiscard]] FileResult<std::unique_ptr<OpenFile>> openFile(const std::string& path,
                                                             FileSystem& fileSystem);

}  // namespace Orvane
