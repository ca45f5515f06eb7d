// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// A file open for appending. One thread at a time. Destruction closes it.
class VARNEL_API AppendFile {
 public:
  virtual ~AppendFile() = default;

  /// Appends all the bytes at the end of the file, wherever that is by now: another process may
  /// append to the same file. Returns the system's error (generic category), or none; after an
  /// error some of the bytes may stand in the file.
  [[nodiscard]] virtual std::error_code append(std::string_view bytes) = 0;
};

/// Opens files for appending. Any thread.
class VARNEL_API AppendFiles {
 public:
  virtual ~AppendFiles() = default;
  AppendFiles& operator=(const AppendFiles&) = delete;

  /// Opens the file, and creates it readable and writable by its owner alone (0600) when missing.
  /// A path with a null character is refused (`invalid_argument`), and for root one in another
  /// user's folder (`operation_not_permitted`).
  [[nodiscard]] virtual Result<std::unique_ptr<AppendFile>, std::error_code> open(
      const std::string& path) = 0;
};

}  // namespace Varnel::Platform
