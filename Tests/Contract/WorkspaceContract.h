// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel::Platform::Contract {

/// A user without any application.
class WorkspaceWorld : public World {
 public:
  virtual Workspace& workspace() = 0;
  /// Installs a program under this identifier and returns its file; with a bundle, the folder.
  virtual URL install(const std::string& identifier, bool hasBundle) = 0;
  virtual void remove(const std::string& identifier) = 0;
};

using WorkspaceContract = Suite<WorkspaceWorld>;

}  // namespace Varnel::Platform::Contract
