// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform::Linux {

/// What becomes of folders that are missing on the way to one.
enum class Missing { fails, isMade };

/// A folder that is held by a descriptor, whatever its path comes to mean. No link is followed on
/// the way there (`not_a_directory`). A value of one owner.
struct HeldFolder final {
  [[nodiscard]] static Result<HeldFolder, std::error_code> open(std::string_view path,
                                                                Missing missing);

  POSIX::FileDescriptor folder;
  std::string path;  ///< As it was walked, without a slash at its end: the root's is empty.
  int mount = 0;
  POSIX::FileDescriptor volume;  ///< The top folder of the folder's mount.
  std::string volumePath;        ///< Likewise.
};

/// What a name leads to: nothing unless it is a regular file.
[[nodiscard]] std::optional<FileState> stateAt(int folder, const std::string& name);

/// Opens a folder that belongs to this user, which is no link (`operation_not_permitted`).
[[nodiscard]] Result<POSIX::FileDescriptor, std::error_code> openOwn(int parent,
                                                                     const std::string& name,
                                                                     Missing missing);

/// Moves what has the name, and replaces nothing (`file_exists`).
[[nodiscard]] std::error_code moveAside(int from, const std::string& name, int to,
                                        const std::string& newName);

}  // namespace Varnel::Platform::Linux
