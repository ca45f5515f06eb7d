// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <map>
#include <string>

#include <Varnel/Platform/POSIX/ReplacedFile.h>
#include <Varnel/Platform/Ports/UserDefaults.h>

namespace Varnel::Platform {
class PrivateFiles;
class SystemLog;
}  // namespace Varnel::Platform

namespace Varnel::Platform::Bare {

/// Settings as one JSON object of texts. The file alone holds them: each call reads it anew, and
/// each change is made to what the last process left, under a lock.
///
/// A file that is no such object counts as empty, until a change sets it aside as ".damaged"; one
/// that cannot be read at all is never changed. Either is said to the system's log, once. Any
/// thread.
class JSONDefaults final : public UserDefaults {
 public:
  JSONDefaults(PrivateFiles& files, SystemLog& systemLog, std::string path);

 private:
  using Texts = std::map<std::string, std::string>;

  [[nodiscard]] std::optional<std::string> readText(const std::string& key) const override;
  [[nodiscard]] std::optional<PlatformError> writeText(const std::string& key,
                                                       const std::string& text) override;
  [[nodiscard]] std::optional<PlatformError> removeText(const std::string& key) override;
  [[nodiscard]] std::optional<PlatformError> change(const std::function<void(Texts&)>& edit);
  void complain(const std::string& trouble) const;

  SystemLog& systemLog_;
  const std::string path_;
  POSIX::ReplacedFile file_;
  mutable std::atomic<bool> hasComplained_ = false;
};

}  // namespace Varnel::Platform::Bare
