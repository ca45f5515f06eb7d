// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <system_error>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// The named attributes that file systems keep beside a file's content. Any thread.
class VARNEL_API ExtendedAttributes {
 public:
  virtual ~ExtendedAttributes() = default;
  ExtendedAttributes& operator=(const ExtendedAttributes&) = delete;

  /// The bytes of the attribute `name` of the file or folder at `path`; symbolic links are
  /// followed. Absent when the file has no such attribute. Failed (generic category) when the file
  /// does not exist or may not be read, when its file system has no attributes, and when the name
  /// is empty or it or the path holds a null character (`invalid_argument`).
  [[nodiscard]] virtual Result<std::optional<std::string>, std::error_code> value(
      const std::string& path, const std::string& name) = 0;
};

}  // namespace Varnel::Platform
