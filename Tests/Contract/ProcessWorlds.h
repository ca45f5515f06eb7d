// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>
#include <Varnel/Platform/Ports/SessionBoard.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Contract {

class ProcessInfoWorld : public WorldOf<ProcessInfo> {
 public:
  virtual void setEnvironment(const std::string& name, const std::string& value) = 0;
};
using ProcessInfoContract = Suite<ProcessInfoWorld>;

/// A machine with a few programs.
class ProcessLauncherWorld : public WorldOf<ProcessLauncher> {
 public:
  struct Program {
    std::string path;
    std::vector<std::string> arguments;
  };

  virtual Program thatPrints(const std::string& text) = 0;
  /// Ends only when somebody ends it.
  virtual Program thatWaits() = 0;
  virtual Program thatDoesNotExist() = 0;
};
using ProcessLauncherContract = Suite<ProcessLauncherWorld>;

using ReadingPriorityContract = Suite<WorldOf<ReadingPriority>>;

/// The board of a session in which another process runs.
class SessionBoardWorld : public WorldOf<SessionBoard> {
 public:
  virtual void postByAnother(const std::string& text) = 0;
  virtual void endAnother() = 0;
};
using SessionBoardContract = Suite<SessionBoardWorld>;

class StandardOutputWorld : public WorldOf<StandardOutput> {
 public:
  /// All that was printed. Nothing is printed after it.
  virtual std::string printed() = 0;
};
using StandardOutputContract = Suite<StandardOutputWorld>;

class SystemLogWorld : public WorldOf<SystemLog> {
 public:
  /// All that the log has been given, each line ended by a line feed.
  virtual std::string text() = 0;
};
using SystemLogContract = Suite<SystemLogWorld>;

}  // namespace Varnel::Platform::Contract
