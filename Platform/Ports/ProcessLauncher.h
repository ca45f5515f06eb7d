// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// A program that was launched, with pipes as its standard input and output. One thread at a time.
/// Destruction ends it if it still runs, and leaves nothing of it behind.
class VARNEL_API LaunchedProcess {
 public:
  virtual ~LaunchedProcess() = default;

  /// Whether it still runs. Returns at once.
  [[nodiscard]] virtual bool isRunning() = 0;

  /// Ends it, and what it has started, at once; waits for its end. Does nothing once it has ended.
  virtual void terminate() = 0;

  /// Everything that its output pipe holds, which is empty then. Never waits: to be called after
  /// the program has ended.
  [[nodiscard]] virtual std::string readOutput() = 0;
};

/// Launches programs, with no shell in between. Any thread.
class VARNEL_API ProcessLauncher {
 public:
  virtual ~ProcessLauncher() = default;
  ProcessLauncher& operator=(const ProcessLauncher&) = delete;

  /// Starts the program at `path`. It inherits only the environment and standard error; its input
  /// is an open pipe without any data. The output pipe is as large as the system allows: a program
  /// that writes more waits until it is terminated. Failed (generic category) when the program
  /// cannot be started, or a text holds a null character (`invalid_argument`).
  [[nodiscard]] virtual Result<std::unique_ptr<LaunchedProcess>, std::error_code> launch(
      const std::string& path, const std::vector<std::string>& arguments) = 0;
};

}  // namespace Varnel::Platform
