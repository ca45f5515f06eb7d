// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <functional>
#include <string>

#include <Varnel/Platform/Linux/MainLoop/MainLoopSource.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Platform::Linux {

/// Calls back, on the main thread, after a file of a folder was written, made, moved or removed.
/// Where the folder cannot be watched, nothing is reported.
class FileWatch final {
 public:
  FileWatch(const std::filesystem::path& folder, std::string name, std::function<void()> changed);
  /// Calls back with the name of anything that was made in the folder, or moved into it.
  FileWatch(const std::filesystem::path& folder, std::function<void(const std::string& name)> come);
  FileWatch(const FileWatch&) = delete;
  FileWatch& operator=(const FileWatch&) = delete;

 private:
  void readEvents();

  const std::string name_;  ///< Empty for any.
  const std::function<void(const std::string& name)> changed_;
  const POSIX::FileDescriptor descriptor_;
  const MainLoopSource source_;
};

}  // namespace Varnel::Platform::Linux
