// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/AppendFiles.h>

namespace Varnel::Platform::Contract {

/// A disk with a place for a file that does not exist yet.
class AppendFilesWorld : public World {
 public:
  virtual AppendFiles& files() = 0;
  virtual std::string path() = 0;
  /// What the file there holds.
  virtual std::string text() = 0;
  /// A file on a disk without room, which opens.
  virtual std::string pathOnAFullDisk() = 0;
  /// A place in a folder that does not exist.
  virtual std::string pathInNoFolder() = 0;
};
using AppendFilesContract = Suite<AppendFilesWorld>;

}  // namespace Varnel::Platform::Contract
