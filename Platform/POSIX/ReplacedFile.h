// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {
class FileLock;
class PrivateFiles;
}  // namespace Varnel::Platform

namespace Varnel::Platform::POSIX {

/// A small file of this user alone that is replaced as a whole, so that a reader, a crash or a loss
/// of power finds one text or the other. Processes that change it take its lock first:
///
///     const auto lock = file.lock();
///     if (!lock) return lock.error();
///     const auto text = file.text();  // as the last process left it
///     …
///     if (auto error = file.replace(newText)) return error;
///
/// Beside the file lie its lock (".lock"), a text that a crash left half written (".new"), and one
/// that was set aside (".damaged"). Any thread.
class ReplacedFile final {
 public:
  ReplacedFile(PrivateFiles& files, std::string path);

  /// The text; absent when there is no file. A link, and a file of somebody else, is refused.
  [[nodiscard]] Result<std::optional<std::string>> text() const;

  /// Waits up to a second for whoever has the lock, then fails with `timed_out`.
  [[nodiscard]] Result<std::unique_ptr<FileLock>> lock();

  /// With the lock held: nothing when the new text is on the disk, else why not. More than 1 MiB is
  /// refused (`file_too_large`).
  [[nodiscard]] std::optional<PlatformError> replace(std::string_view text);
  [[nodiscard]] std::optional<PlatformError> setAside();

 private:
  PrivateFiles& files_;
  const std::string path_;
};

}  // namespace Varnel::Platform::POSIX
