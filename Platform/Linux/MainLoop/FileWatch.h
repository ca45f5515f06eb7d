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
  FileWatch(const FileWatch&) = delete;
  FileWatch& operator=(const FileWatch&) = delete;

 private:
  void readEvents();

  const std::string name_;
  const std::function<void()> changed_;
  const POSIX::FileDescriptor descriptor_;
  const MainLoopSource source_;
};

}  // namespace Varnel::Platform::Linux
