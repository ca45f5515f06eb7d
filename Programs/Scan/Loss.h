// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <system_error>

namespace Orvane {

/// Why a file or folder had no part in the result.
struct Loss {
  enum class Kind {
    unreadable,  ///< The system refused or failed to read it.
    vanished,    ///< It was gone when its turn came.
    changed,     ///< It is no longer what the walk saw.
    incomplete,  ///< A part of the folder was read before the system failed.
  };

  Kind kind;
  std::error_code error;  ///< The system's reason; none when the file changed.

  /// The loss that an error of the file system stands for.
  [[nodiscard]] static Loss because(std::error_code error) {
    if (error == std::errc::no_such_file_or_directory) return {Kind::vanished, error};
    // A symbolic link, a socket, a pipe, a folder or another thing took the place of what the walk
    // saw.
    if (error == std::errc::too_many_symbolic_link_levels || error == std::errc::not_a_directory ||
        error == std::errc::is_a_directory || error == std::errc::invalid_seek ||
        error == std::errc::no_such_device_or_address)
      return {Kind::changed, {}};
    return {Kind::unreadable, error};
  }
};

/// A file or folder that had no part in the result.
struct LostPath {
  std::string path;
  Loss loss;
};

}  // namespace Orvane
