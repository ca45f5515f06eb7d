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
/// Destruction ends it if it still runs; nothing of it stays behind.
class VARNEL_API LaunchedProcess {
 public:
  virtual ~LaunchedProcess() = default;

  /// Whether it still runs. Returns at once.
  [[nodiscard]] virtual bool isRunning() = 0;

  /// Ends it, and what it has started, at once; waits for its end. Does nothing once it has ended.
  virtual void terminate() = 0;

  /// What its output pipe holds, to the end. Never waits: to be called after it has ended.
  [[nodiscard]] virtual std::string readOutput() = 0;
};

/// Launches programs, with no shell in between. Any thread.
class VARNEL_API ProcessLauncher {
 public:
  virtual ~ProcessLauncher() = default;

  /// Starts the program at `path`. It inherits the environment and standard error and nothing else;
  /// its input is an open pipe that never gives anything. The output pipe is as large as the system
  /// allows: a program that writes more waits until it is terminated. Failed (generic category)
  /// when the program cannot be started.
  [[nodiscard]] virtual Result<std::unique_ptr<LaunchedProcess>, std::error_code> launch(
      const std::string& path, const std::vector<std::string>& arguments) = 0;
};

}  // namespace Varnel::Platform
