// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <string>

#include <Varnel/Platform/POSIX/ReplacedFile.h>
#include <Varnel/Platform/Ports/UserDefaults.h>

struct _GKeyFile;

namespace Varnel::Platform {
class PrivateFiles;
class SystemLog;
}  // namespace Varnel::Platform

namespace Varnel::Platform::Linux {

/// Settings in a key file ("key=value"). The file alone holds them: each call reads it anew, and
/// each change is made to what the last process left, under a lock.
///
/// A file that cannot be read as a key file counts as empty, until a change sets it aside as
/// ".damaged"; one that cannot be read at all is never changed. Either is said to the system's log,
/// once. Any thread.
class KeyFileDefaults final : public UserDefaults {
 public:
  KeyFileDefaults(PrivateFiles& files, SystemLog& systemLog, std::string path);

 private:
  [[nodiscard]] std::optional<std::string> readText(const std::string& key) const override;
  [[nodiscard]] std::optional<PlatformError> writeText(const std::string& key,
                                                       const std::string& text) override;
  [[nodiscard]] std::optional<PlatformError> removeText(const std::string& key) override;
  [[nodiscard]] std::optional<PlatformError> change(const std::function<void(_GKeyFile*)>& edit);
  void complain(const std::string& trouble) const;

  SystemLog& systemLog_;
  const std::string path_;
  POSIX::ReplacedFile file_;
  mutable std::atomic<bool> hasComplained_ = false;
};

}  // namespace Varnel::Platform::Linux
